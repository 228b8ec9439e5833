// Another process reading the store while commits go on sees the old or the
// new configuration, never a mix.

#include "tests/reference/rovofixture.h"

#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <string>

extern char **environ;

namespace {

using namespace reftest;

class Reader
{
public:
    explicit Reader(std::uint32_t perGeneration)
    {
        int toChild[2], fromChild[2];
        EXPECT_EQ(pipe(toChild), 0);
        EXPECT_EQ(pipe(fromChild), 0);
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_adddup2(&actions, toChild[0], STDIN_FILENO);
        posix_spawn_file_actions_adddup2(&actions, fromChild[1], STDOUT_FILENO);
        posix_spawn_file_actions_addclose(&actions, toChild[1]);
        posix_spawn_file_actions_addclose(&actions, fromChild[0]);
        std::string count = std::to_string(perGeneration);
        char *argv[] = {const_cast<char *>(ROVO_STORE_READER), count.data(), nullptr};
        EXPECT_EQ(posix_spawn(&m_pid, ROVO_STORE_READER, &actions, nullptr, argv, environ), 0);
        posix_spawn_file_actions_destroy(&actions);
        close(toChild[0]);
        close(fromChild[1]);
        m_stdin = toChild[1];
        m_stdout = fromChild[0];
    }

    ~Reader()
    {
        if (m_stdin >= 0)
            close(m_stdin);
        if (m_stdout >= 0)
            close(m_stdout);
        if (m_pid > 0)
            waitpid(m_pid, nullptr, 0);
    }

    // The next line without its line end; empty at the end of the output or
    // when the time ran out.
    std::string Line(std::chrono::milliseconds within = std::chrono::seconds(20))
    {
        const auto deadline = std::chrono::steady_clock::now() + within;
        for (;;) {
            if (const std::size_t end = m_pending.find('\n'); end != std::string::npos) {
                std::string line = m_pending.substr(0, end);
                m_pending.erase(0, end + 1);
                return line;
            }
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
            pollfd entry{m_stdout, POLLIN, 0};
            if (left.count() <= 0 || poll(&entry, 1, int(left.count())) <= 0)
                return {};
            char chunk[4096];
            const ssize_t got = read(m_stdout, chunk, sizeof chunk);
            if (got <= 0)
                return {};
            m_pending.append(chunk, std::size_t(got));
        }
    }

    // Reads lines until the given one; false when it did not come in time.
    bool WaitForLine(const std::string &expected)
    {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(20);
        for (;;) {
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
            if (left.count() <= 0)
                return false;
            const std::string line = Line(left);
            if (line == expected)
                return true;
            if (line.empty())
                return false;
        }
    }

    // Tells the reader to stop; returns its report and exit code.
    std::pair<std::string, int> Finish()
    {
        close(m_stdin);
        m_stdin = -1;
        std::string report;
        for (std::string line = Line(); !line.empty(); line = Line())
            report = line;
        int status = 0;
        waitpid(m_pid, &status, 0);
        m_pid = -1;
        return {report, WIFEXITED(status) ? WEXITSTATUS(status) : -1};
    }

private:
    pid_t m_pid = -1;
    int m_stdin = -1;
    int m_stdout = -1;
    std::string m_pending;
};

// The number after "name=" in the reader's report, or -1.
long ReportValue(const std::string &report, const std::string &name)
{
    const std::size_t at = report.find(name + "=");
    return at == std::string::npos ? -1 : std::stol(report.substr(at + name.size() + 1));
}

using StoreProcesses = RovoTest;

TEST_F(StoreProcesses, AReaderSeesWholeCommitsOnly)
{
    constexpr std::uint32_t perGeneration = 60;
    constexpr int generations = 15;
    Reader reader(perGeneration);
    ASSERT_EQ(reader.Line(), "ready");
    ASSERT_EQ(reader.Line(), "seen none");

    // Each commit starts while the reader reads the one before it, so its
    // reads overlap the commits however busy the machine is.
    for (int generation = 1; generation <= generations; ++generation) {
        auto editor = Editor();
        for (std::uint32_t i = 0; generation > 1 && i < perGeneration; ++i) {
            const std::u16string old = U16("/gen/" + std::to_string(generation - 1) + "/" + std::to_string(i));
            OkVoid([&](std::int32_t *status) { editor->RemoveFolder(WString(old), 1, status); });
        }
        for (std::uint32_t i = 0; i < perGeneration; ++i) {
            const std::u16string path = U16("/gen/" + std::to_string(generation) + "/" + std::to_string(i));
            const std::u16string alias = U16("g" + std::to_string(generation) + "-" + std::to_string(i));
            AddArea(editor.get(), path.c_str(), alias.c_str());
        }
        Commit(editor.get());
        ASSERT_TRUE(reader.WaitForLine("seen /gen/" + std::to_string(generation))) << "generation " << generation;
    }

    const auto [report, exitCode] = reader.Finish();
    EXPECT_EQ(exitCode, 0) << report;
    EXPECT_EQ(ReportValue(report, "torn"), 0) << report;
    EXPECT_EQ(ReportValue(report, "generations"), generations + 1) << report;
    EXPECT_GT(ReportValue(report, "reads"), generations) << report;
    EXPECT_EQ(Areas().size(), perGeneration);
}

} // namespace
