#include "krn/osdep/hostinfo.h"
#include "krn/osdep/inifile.h"

#include "fakehostnetwork.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

namespace cv::krn::osdep {
namespace {

// Names by index: even ones resolve to loopback, odd ones do not resolve.
std::u16string NameFor(int index)
{
    return u"host" + QString::number(index).toStdU16String();
}

TEST(KrnHostInfoThreaded, ManyThreadsGetConsistentAnswers)
{
    auto state = std::make_shared<krntest::FakeHostNetwork::State>();
    for (int i = 0; i < 80; i += 2)
        state->names[NameFor(i)] = {QHostAddress(QStringLiteral("127.0.0.2"))};
    HostInfo info(std::make_unique<krntest::FakeHostNetwork>(state), IniFile::Parse("[Shared]\nLocalAdapterCacheTimeoutSeconds=0\n"));

    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([&info, &wrong, t] {
            for (int round = 0; round < 200; ++round) {
                const int index = (round * 7 + t * 13) % 80;
                if (info.IsLocal(NameFor(index)) != (index % 2 == 0))
                    ++wrong;
                if (!info.IsLocal(u"localhost"))
                    ++wrong;
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(wrong.load(), 0);
}

TEST(KrnHostInfoThreaded, TheProcessInstanceServesSeveralThreads)
{
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < 3; ++t) {
        threads.emplace_back([&wrong] {
            HostInfo &info = HostInfo::Instance();
            for (int round = 0; round < 20; ++round) {
                wrong += info.IsLocal(u"localhost") ? 0 : 1;
                wrong += info.IsLocal(u"127.0.0.1") ? 0 : 1;
                wrong += info.IsLocal(u"192.0.2.7") ? 1 : 0;
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(wrong.load(), 0);
}

} // namespace
} // namespace cv::krn::osdep
