// Another process reading the store while commits go on sees the old or the
// new configuration, never a mix.

#include "tests/reference/rovofixture.h"

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
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
        m_stdout = fdopen(fromChild[0], "r");
    }

    ~Reader()
    {
        if (m_stdin >= 0)
            close(m_stdin);
        if (m_stdout)
            std::fclose(m_stdout);
        if (m_pid > 0)
            waitpid(m_pid, nullptr, 0);
    }

    std::string Line()
    {
        char buffer[256] = {};
        return std::fgets(buffer, sizeof buffer, m_stdout) ? std::string(buffer) : std::string();
    }

    // Tells the reader to stop; returns its report and exit code.
    std::pair<std::string, int> Finish()
    {
        close(m_stdin);
        m_stdin = -1;
        std::string report = Line();
        int status = 0;
        waitpid(m_pid, &status, 0);
        m_pid = -1;
        return {report, WIFEXITED(status) ? WEXITSTATUS(status) : -1};
    }

private:
    pid_t m_pid = -1;
    int m_stdin = -1;
    std::FILE *m_stdout = nullptr;
};

using StoreProcesses = RovoTest;

TEST_F(StoreProcesses, AReaderSeesWholeCommitsOnly)
{
    constexpr std::uint32_t perGeneration = 60;
    Reader reader(perGeneration);
    ASSERT_EQ(reader.Line(), "ready\n");

    for (int generation = 1; generation <= 15; ++generation) {
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
    }

    const auto [report, exitCode] = reader.Finish();
    EXPECT_EQ(exitCode, 0) << report;
    EXPECT_NE(report.find("torn=0"), std::string::npos) << report;
    EXPECT_EQ(Areas().size(), perGeneration);
}

} // namespace
