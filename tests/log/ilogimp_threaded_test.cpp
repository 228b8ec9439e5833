#include "log/ilogimp.h"

#include "logfilereader.h"
#include "support/signal.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <set>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace cv::util::file::log;

TEST(LogThreads, LinesFromSeveralThreadsNeverInterleave)
{
    constexpr int kThreads = 4;
    constexpr int kLines = 400;
    const std::string padding(60, '-');
    testsupport::TempDir dir;
    // The receiver is called under the log's lock.
    std::vector<std::string> received;
    testsupport::Signal firstReceived;
    ILogImp log(dir.file("a.log").u16string(), 0, [&](LineKind, std::uint32_t, std::u16string_view text) {
        received.emplace_back(text.begin(), text.end());
        firstReceived.Raise();
    });
    log.SwitchOn(0);

    std::atomic<bool> writing{true};
    bool delivered = false;
    // Once lines reach the receiver, settings change while lines are written;
    // none of them may tear a line.
    std::thread toggler([&] {
        delivered = firstReceived.WaitFor(std::chrono::seconds(10));
        for (std::uint32_t i = 0; writing; ++i) {
            if (i % 2)
                log.SwitchOn(i);
            else
                log.SwitchOff();
            log.SetInfoMask(i);
            log.SetMaxFileSize(0);
            (void)log.GetMaxFileSize();
            log.SetOutputFlags(log.GetOutputFlags());
        }
    });
    std::vector<std::thread> writers;
    for (int t = 0; t < kThreads; ++t)
        writers.emplace_back([&, t] {
            for (int i = 0; i < kLines; ++i)
                log.Warning(nullptr, 0) << "thread " << t << " line " << i << ' ' << padding << '<';
        });
    for (auto &writer : writers)
        writer.join();
    writing = false;
    toggler.join();
    log.CloseFile();

    const std::vector<std::string> lines = logtest::ReadLines(dir.file("a.log"));
    ASSERT_EQ(lines.size(), 1u + kThreads * kLines);
    EXPECT_EQ(lines[0], logtest::kBanner);
    std::set<std::string> unique(lines.begin() + 1, lines.end());
    EXPECT_EQ(unique.size(), std::size_t{kThreads * kLines});
    for (int t = 0; t < kThreads; ++t)
        for (int i = 0; i < kLines; ++i)
            EXPECT_EQ(unique.count("DSA: Warning: thread " + std::to_string(t) + " line " + std::to_string(i) + ' ' +
                                   padding + '<'),
                      1u)
                << "thread " << t << " line " << i;
    EXPECT_EQ(log.GetWarningCount(), std::uint64_t{kThreads * kLines});

    // What reached the receiver is what reached the file, each line once.
    EXPECT_TRUE(delivered);
    EXPECT_FALSE(received.empty());
    for (const std::string &text : received)
        EXPECT_EQ(unique.count(text), 1u) << text;
    EXPECT_EQ(std::set<std::string>(received.begin(), received.end()).size(), received.size());
}

} // namespace
