#include "support/sorvikprocess.h"

#include "krn/osdep/runtimefolder.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>

#include <cstdlib>
#include <stdexcept>
#include <thread>

extern char **environ;

namespace testsupport {

SorvikProcess::SorvikProcess(const std::string &program, const std::vector<std::string> &arguments,
                             const std::filesystem::path &output)
{
    std::vector<char *> argv;
    argv.push_back(const_cast<char *>(program.c_str()));
    for (const std::string &argument : arguments)
        argv.push_back(const_cast<char *>(argument.c_str()));
    argv.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    if (!output.empty())
        posix_spawn_file_actions_addopen(&actions, 1, output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    const int failed = posix_spawn(&m_pid, program.c_str(), &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (failed)
        throw std::runtime_error("cannot start " + program);
}

SorvikProcess::~SorvikProcess()
{
    if (m_pid > 0)
        Stop(SIGKILL);
}

std::filesystem::path SorvikProcess::SocketOf(const std::string &portName)
{
    const std::filesystem::path root = cv::krn::osdep::RuntimeDirectory();
    if (portName.empty())
        return root / "VEK_INDEX_SERVICE_SEARCH_BROWSE" / "VEK_INDEX_SERVICE.sock";
    return root / "VEK_INDEX_SERVICE_SERVER" / (portName + ".sock");
}

bool SorvikProcess::WaitUntilServing(const std::string &portName, std::chrono::milliseconds within)
{
    const auto deadline = std::chrono::steady_clock::now() + within;
    while (std::chrono::steady_clock::now() < deadline) {
        if (std::filesystem::exists(SocketOf(portName)))
            return true;
        int status = 0;
        if (m_pid > 0 && ::waitpid(m_pid, &status, WNOHANG) == m_pid) {
            m_pid = -1;
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return false;
}

int SorvikProcess::Stop(int signal, std::chrono::milliseconds within)
{
    if (m_pid <= 0)
        return -1;
    ::kill(m_pid, signal);
    return Wait(within);
}

int SorvikProcess::Wait(std::chrono::milliseconds within)
{
    const auto deadline = std::chrono::steady_clock::now() + within;
    while (m_pid > 0) {
        int status = 0;
        if (::waitpid(m_pid, &status, WNOHANG) == m_pid) {
            m_pid = -1;
            return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
        }
        if (std::chrono::steady_clock::now() >= deadline) {
            ::kill(m_pid, SIGKILL);
            ::waitpid(m_pid, &status, 0);
            m_pid = -1;
            return -1;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return -1;
}

} // namespace testsupport
