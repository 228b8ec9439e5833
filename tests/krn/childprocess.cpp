#include "childprocess.h"

#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <system_error>
#include <unistd.h>

extern char **environ;

namespace krntest {

namespace {

void Check(int result, const char *what)
{
    if (result != 0)
        throw std::system_error(result, std::generic_category(), what);
}

} // namespace

ChildProcess::ChildProcess(const std::vector<std::string> &extraEnvironment)
{
    int output[2];
    int input[2];
    if (::pipe2(output, O_CLOEXEC) != 0 || ::pipe2(input, O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "pipe2");

    std::vector<std::string> environment(extraEnvironment);
    for (char **entry = environ; *entry; ++entry)
        environment.emplace_back(*entry);
    std::vector<char *> envp;
    for (std::string &entry : environment)
        envp.push_back(entry.data());
    envp.push_back(nullptr);
    std::string program = "/proc/self/exe";
    char *argv[] = {program.data(), nullptr};

    posix_spawn_file_actions_t actions;
    Check(::posix_spawn_file_actions_init(&actions), "posix_spawn_file_actions_init");
    ::posix_spawn_file_actions_adddup2(&actions, input[0], STDIN_FILENO);
    ::posix_spawn_file_actions_adddup2(&actions, output[1], STDOUT_FILENO);
    const int spawned = ::posix_spawn(&m_pid, program.c_str(), &actions, nullptr, argv, envp.data());
    ::posix_spawn_file_actions_destroy(&actions);
    ::close(input[0]);
    ::close(output[1]);
    m_input = input[1];
    m_output = output[0];
    if (spawned != 0) {
        ::close(m_input);
        ::close(m_output);
        Check(spawned, "posix_spawn");
    }
}

ChildProcess::~ChildProcess()
{
    ::close(m_input);
    ::close(m_output);
    if (m_pid > 0)
        ::waitpid(m_pid, nullptr, 0);
}

bool ChildProcess::WaitForLine(const std::string &line, std::chrono::milliseconds deadline)
{
    const auto end = std::chrono::steady_clock::now() + deadline;
    while (m_received.find(line + "\n") == std::string::npos) {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - std::chrono::steady_clock::now());
        if (left.count() <= 0)
            return false;
        pollfd ready{m_output, POLLIN, 0};
        if (::poll(&ready, 1, static_cast<int>(left.count())) <= 0)
            continue;
        char buffer[256];
        const ssize_t count = ::read(m_output, buffer, sizeof buffer);
        if (count <= 0)
            return false;
        m_received.append(buffer, static_cast<std::size_t>(count));
    }
    return true;
}

void ChildProcess::Kill()
{
    ::kill(m_pid, SIGKILL);
    ::waitpid(m_pid, nullptr, 0);
    m_pid = -1;
}

} // namespace krntest
