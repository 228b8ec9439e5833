#include "krn/osdep/process.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fcntl.h>
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

TEST(StartDetachedProcess, MissingOrUnusableProgramIsReported)
{
    testsupport::TempDir dir;
    EXPECT_FALSE(StartDetachedProcess(dir.file("missing").string()));
    std::ofstream(dir.file("plain")) << "not a program\n";
    EXPECT_FALSE(StartDetachedProcess(dir.file("plain").string()));
    EXPECT_FALSE(StartDetachedProcess("sorvik-no-such-program-on-the-path"));
}

} // namespace
