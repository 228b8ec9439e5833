#include "krn/osdep/process.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

namespace {

using cv::krn::osdep::StartDetachedProcess;

std::string WaitForFile(const std::filesystem::path &file)
{
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (std::chrono::steady_clock::now() < deadline) {
        std::ifstream in(file);
        std::stringstream text;
        text << in.rdbuf();
        if (text.str().find("end") != std::string::npos)
            return text.str();
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return {};
}

TEST(StartDetachedProcess, RunsTheProgramInItsOwnSessionWithoutTheCallersDescriptors)
{
    testsupport::TempDir dir;
    const auto script = dir.file("program");
    const auto report = dir.file("report");
    // The descriptor 9 is the caller's, left inheritable on purpose.
    std::ofstream(script) << "#!/bin/sh\n"
                          << "set -- $(cat /proc/$$/stat)\n"
                          << "{ [ -e /proc/$$/fd/9 ] && echo inherited; [ \"$6\" -eq $$ ] && echo session; echo end; } > '"
                          << report.string() << "'\n";
    std::filesystem::permissions(script, std::filesystem::perms::owner_all);
    const int inheritable = ::open("/dev/null", O_RDONLY);
    ASSERT_GE(::dup2(inheritable, 9), 0);

    ASSERT_TRUE(StartDetachedProcess(script.string()));
    const std::string text = WaitForFile(report);
    ::close(9);
    ::close(inheritable);
    EXPECT_EQ(text.find("inherited"), std::string::npos) << text;
    EXPECT_NE(text.find("session"), std::string::npos) << text;
}

// Restores a standard descriptor that a test pointed elsewhere.
class RedirectedDescriptor final
{
public:
    RedirectedDescriptor(int target, int replacement) : m_target(target), m_saved(::dup(target))
    {
        ::dup2(replacement, target);
    }
    ~RedirectedDescriptor()
    {
        ::dup2(m_saved, m_target);
        ::close(m_saved);
    }

private:
    int m_target;
    int m_saved;
};

bool EndOfFileWithin(int fd, std::chrono::milliseconds within)
{
    pollfd entry{fd, POLLIN, 0};
    if (::poll(&entry, 1, int(within.count())) != 1)
        return false;
    char byte;
    return ::read(fd, &byte, 1) == 0;
}

TEST(StartDetachedProcess, TheCallersOutputEndsWithTheCallerWhileTheProgramRuns)
{
    testsupport::TempDir dir;
    const auto script = dir.file("program");
    const auto gate = dir.file("gate");
    const auto report = dir.file("report");
    ASSERT_EQ(::mkfifo(gate.c_str(), 0600), 0);
    // Blocks on the gate until the test lets it end.
    std::ofstream(script) << "#!/bin/sh\n"
                          << "read line < '" << gate.string() << "'\n"
                          << "{ readlink /proc/$$/fd/0; readlink /proc/$$/fd/2; echo end; } > '" << report.string()
                          << "'\n";
    std::filesystem::permissions(script, std::filesystem::perms::owner_all);

    int output[2];
    ASSERT_EQ(::pipe(output), 0);
    {
        RedirectedDescriptor out(STDOUT_FILENO, output[1]);
        RedirectedDescriptor err(STDERR_FILENO, output[1]);
        ASSERT_TRUE(StartDetachedProcess(script.string()));
    }
    ::close(output[1]);
    EXPECT_TRUE(EndOfFileWithin(output[0], std::chrono::seconds(5)))
        << "whoever reads the caller's output sees its end while the program still runs";
    ::close(output[0]);

    std::ofstream(gate) << "go\n";
    const std::string text = WaitForFile(report);
    EXPECT_EQ(text, "/dev/null\n/dev/null\nend\n");
}

TEST(StartDetachedProcess, OutputGoesToAFileForItsOwnerAlone)
{
    testsupport::TempDir dir;
    const auto script = dir.file("program");
    const auto log = dir.file("program.log");
    std::ofstream(script) << "#!/bin/sh\necho out\necho err >&2\necho end\n";
    std::filesystem::permissions(script, std::filesystem::perms::owner_all);
    std::ofstream(log) << "earlier\n";
    std::filesystem::permissions(log, std::filesystem::perms::owner_read | std::filesystem::perms::owner_write |
                                          std::filesystem::perms::group_read | std::filesystem::perms::others_read);

    ASSERT_TRUE(StartDetachedProcess(script.string(), log));
    EXPECT_EQ(WaitForFile(log), "earlier\nout\nerr\nend\n");
    struct stat status = {};
    ASSERT_EQ(::stat(log.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0600u);
}

TEST(StartDetachedProcess, MissingOrUnusableProgramIsReported)
{
    testsupport::TempDir dir;
    EXPECT_FALSE(StartDetachedProcess(dir.file("missing").string()));
    std::ofstream(dir.file("plain")) << "not a program\n";
    EXPECT_FALSE(StartDetachedProcess(dir.file("plain").string()));
    EXPECT_FALSE(StartDetachedProcess("sorvik-no-such-program-on-the-path"));
}

} // namespace
