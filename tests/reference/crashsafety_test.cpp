// What a commit or an export leaves behind when its process is killed at any
// point of it, or its disk fills: a store that opens and holds the old or the
// new configuration, an error for whoever asked, and an old file unchanged.

#include "support/scopedenv.h"
#include "support/sorvikprocess.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

extern char **environ;

namespace {

constexpr const char *kAreasPerGeneration = "60";

struct Outcome
{
    int exitCode = -1; // -1 when ended by a signal
    int signal = 0;
    std::string output;

    bool Said(const std::string &text) const { return output.find(text) != std::string::npos; }
};

// The store writer on a store folder of its own, with its output captured.
Outcome RunWriter(const std::filesystem::path &store, std::vector<std::string> arguments)
{
    std::vector<std::string> environment;
    for (char **entry = environ; *entry; ++entry) {
        if (std::string(*entry).rfind("CORVANE_SORVIK_STORE=", 0) != 0)
            environment.emplace_back(*entry);
    }
    environment.push_back("CORVANE_SORVIK_STORE=" + store.string());
    arguments.insert(arguments.begin(), ROVO_STORE_WRITER);
    std::vector<char *> argv, envp;
    for (std::string &argument : arguments)
        argv.push_back(argument.data());
    argv.push_back(nullptr);
    for (std::string &entry : environment)
        envp.push_back(entry.data());
    envp.push_back(nullptr);

    int output[2];
    EXPECT_EQ(::pipe(output), 0);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, output[1], STDOUT_FILENO);
    posix_spawn_file_actions_addclose(&actions, output[0]);
    pid_t pid = -1;
    EXPECT_EQ(posix_spawn(&pid, ROVO_STORE_WRITER, &actions, nullptr, argv.data(), envp.data()), 0);
    posix_spawn_file_actions_destroy(&actions);
    ::close(output[1]);
    Outcome outcome;
    char buffer[512];
    for (ssize_t got; (got = ::read(output[0], buffer, sizeof buffer)) > 0;)
        outcome.output.append(buffer, std::size_t(got));
    ::close(output[0]);
    int status = 0;
    ::waitpid(pid, &status, 0);
    if (WIFEXITED(status))
        outcome.exitCode = WEXITSTATUS(status);
    else if (WIFSIGNALED(status))
        outcome.signal = WTERMSIG(status);
    return outcome;
}

Outcome Commit(const std::filesystem::path &store, int generation, const std::string &fault = {}, long at = 0)
{
    std::vector<std::string> arguments{"commit", std::to_string(generation), kAreasPerGeneration};
    if (!fault.empty()) {
        arguments.push_back(fault);
        arguments.push_back(std::to_string(at));
    }
    return RunWriter(store, arguments);
}

// The generation a store holds, or a text saying what is wrong with it.
std::string Held(const std::filesystem::path &store)
{
    const Outcome check = RunWriter(store, {"check", kAreasPerGeneration});
    return check.exitCode == 0 ? check.output.substr(0, check.output.find('\n')) : "broken: " + check.output;
}

// "operations=<n>" lines: before the commit and after it.
std::pair<long, long> OperationRange(const std::string &output)
{
    std::vector<long> counts;
    std::istringstream lines(output);
    for (std::string line; std::getline(lines, line);) {
        if (line.rfind("operations=", 0) == 0)
            counts.push_back(std::stol(line.substr(11)));
    }
    return counts.size() == 2 ? std::pair{counts[0], counts[1]} : std::pair{0L, 0L};
}

class CommitFaults : public ::testing::Test
{
protected:
    void SetUp() override
    {
        ASSERT_TRUE(Commit(Base(), 1).Said("committed"));
        ASSERT_EQ(Held(Base()), "generation=1");
        const Outcome full = Commit(Fresh("measure"), 2);
        ASSERT_TRUE(full.Said("committed")) << full.output;
        m_range = OperationRange(full.output);
        ASSERT_LT(m_range.first, m_range.second) << full.output;
    }

    std::filesystem::path Base() const { return m_dir.path() / "base"; }
    // A copy of the store that holds generation 1.
    std::filesystem::path Fresh(const std::string &name) const
    {
        const auto copy = m_dir.path() / name;
        std::filesystem::copy(Base(), copy, std::filesystem::copy_options::recursive);
        return copy;
    }
    // Operations of the commit, at most count of them, spread over it.
    std::vector<long> Points(std::size_t count) const
    {
        std::vector<long> points;
        const long span = m_range.second - m_range.first;
        for (std::size_t i = 0; i < count; ++i)
            points.push_back(m_range.first + 1 + long(i) * (span - 1) / long(std::max<std::size_t>(count - 1, 1)));
        points.erase(std::unique(points.begin(), points.end()), points.end());
        return points;
    }

    testsupport::TempDir m_dir;
    std::pair<long, long> m_range;
};

TEST_F(CommitFaults, AHostKilledAnywhereInACommitLeavesTheOldOrTheNewConfiguration)
{
    int old = 0, changed = 0;
    for (const long at : Points(40)) {
        const auto store = Fresh("killed-" + std::to_string(at));
        const Outcome killed = Commit(store, 2, "kill", at);
        EXPECT_EQ(killed.signal, SIGKILL) << at << ": " << killed.output;
        const std::string held = Held(store);
        if (held == "generation=1")
            ++old;
        else if (held == "generation=2")
            ++changed;
        else
            ADD_FAILURE() << "killed at operation " << at << ": " << held;
        std::filesystem::remove_all(store);
    }
    EXPECT_GT(old, 0);
    EXPECT_GT(changed, 0) << "a kill after the commit's last write keeps it";
}

TEST_F(CommitFaults, AFullDiskFailsTheCommitAndKeepsTheOldConfiguration)
{
    for (const long at : Points(8)) {
        const auto store = Fresh("full-" + std::to_string(at));
        const Outcome full = Commit(store, 2, "full", at);
        const std::string held = Held(store);
        // Whatever the commit reported is what the store holds.
        if (full.Said("committed")) {
            EXPECT_EQ(held, "generation=2") << at;
        } else {
            EXPECT_TRUE(full.exitCode == 1 && full.Said("failed=") && held == "generation=1")
                << "full disk at operation " << at << ": exit " << full.exitCode << ", signal " << full.signal
                << ", " << full.output << " / " << held;
        }
        if (at == m_range.first + 1) {
            EXPECT_FALSE(full.Said("committed")) << "the first write of the commit failed";
        }

        // Once there is room again, the same commit goes through.
        if (!full.Said("committed")) {
            EXPECT_TRUE(Commit(store, 2).Said("committed")) << at;
            EXPECT_EQ(Held(store), "generation=2") << at;
        }
        std::filesystem::remove_all(store);
    }
}

std::string FileText(const std::filesystem::path &file)
{
    std::ifstream in(file, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), {});
}

TEST_F(CommitFaults, AFullDiskDuringAnExportKeepsTheOldFile)
{
    const auto file = m_dir.path() / "configuration.skc";
    ASSERT_TRUE(RunWriter(Base(), {"export", file.string(), "100000000"}).Said("exported"));
    const std::string before = FileText(file);
    ASSERT_FALSE(before.empty());

    const auto store = Fresh("bigger");
    ASSERT_TRUE(Commit(store, 2).Said("committed"));
    // Room for half of the new file.
    const Outcome full = RunWriter(store, {"export", file.string(), std::to_string(before.size() / 2)});
    EXPECT_TRUE(full.exitCode == 1 && full.Said("failed=-21010")) << full.output;
    EXPECT_EQ(FileText(file), before);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(m_dir.path()), {}), 4)
        << "no temporary file is left beside it";
}

// The server reads the store while it takes a commit up and writes only its
// own status: killing it then leaves the store as the commit left it, and the
// next server takes the commit up.
// The generations a server's output says it took up.
std::vector<long> Applied(const std::string &output)
{
    std::vector<long> generations;
    const std::string mark = "applied configuration ";
    for (auto at = output.find(mark); at != std::string::npos; at = output.find(mark, at + 1))
        generations.push_back(std::stol(output.substr(at + mark.size())));
    return generations;
}

TEST_F(CommitFaults, AServerKilledWhileTakingUpACommitLeavesTheStoreWhole)
{
    const auto store = Fresh("served");
    testsupport::ScopedEnv storeFolder("CORVANE_SORVIK_STORE", store.string());
    testsupport::ScopedEnv runtime("CORVANE_RUNTIME_DIR", (m_dir.path() / "run").string());
    testsupport::ScopedEnv mutexes("CORVANE_MUTEX_DIR", (m_dir.path() / "mutex").string());
    {
        testsupport::SorvikProcess slow(SORVIK_SERVER, {"--apply-delay-ms", "60000"}, m_dir.path() / "slow.out");
        ASSERT_TRUE(slow.WaitUntilServing(""));
        ASSERT_TRUE(Commit(store, 2).Said("committed"));
        EXPECT_EQ(slow.Stop(SIGKILL), 128 + SIGKILL);
    }
    // It took up what it found at its start, and was killed before the commit.
    const std::vector<long> before = Applied(FileText(m_dir.path() / "slow.out"));
    ASSERT_EQ(before.size(), 1u) << FileText(m_dir.path() / "slow.out");
    EXPECT_EQ(Held(store), "generation=2");

    const auto output = m_dir.path() / "next.out";
    testsupport::SorvikProcess next(SORVIK_SERVER, {}, output);
    ASSERT_TRUE(next.WaitUntilServing(""));
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (Applied(FileText(output)).empty() && std::chrono::steady_clock::now() < deadline)
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    const std::vector<long> after = Applied(FileText(output));
    ASSERT_FALSE(after.empty()) << FileText(output);
    EXPECT_GT(after.back(), before.front()) << "the next server takes the commit up";
    EXPECT_EQ(next.Stop(SIGTERM), 0);
}

} // namespace
