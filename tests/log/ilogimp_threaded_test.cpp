#include "log/ilogimp.h"

#include "logfilereader.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <atomic>
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
    std::atomic<int> received{0};
    std::atomic<bool> receivedIntact{true};
    ILogImp log(dir.file("a.log").u16string(), 0, [&](LineKind, std::uint32_t, std::u16string_view text) {
        ++received;
        if (!text.starts_with(u"DSA: Warning: thread ") || !text.ends_with(u"<"))
            receivedIntact = false;
    });

    std::atomic<bool> writing{true};
    // Settings change while lines are written; none of them may tear a line.
    std::thread toggler([&] {
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
    EXPECT_LE(received.load(), kThreads * kLines);
    EXPECT_TRUE(receivedIntact);
}

} // namespace
