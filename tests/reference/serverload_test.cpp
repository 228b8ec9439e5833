// The reference server under load: many clients asking statistics at once,
// for a while. Nothing may fail, and the server must end up holding what it
// held before: no descriptor, no thread, and no memory that grows with time.

#include "serverfixture.h"

#include "support/directstoreaccessref.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace cv::vek::rovo::dunemere;
using testsupport::AccessRef;

[[maybe_unused]] const bool g_registry = (reftest::InstallServerRegistry(), true);

constexpr int kClients = 64;
constexpr auto kDuration = std::chrono::seconds(30);

struct ProcessUsage
{
    std::size_t descriptors = 0;
    long threads = 0;
    long residentKiB = 0;
};

long StatusField(pid_t pid, const std::string &field)
{
    std::ifstream status("/proc/" + std::to_string(pid) + "/status");
    for (std::string line; std::getline(status, line);) {
        if (line.rfind(field + ":", 0) == 0)
            return std::stol(line.substr(field.size() + 1));
    }
    return -1;
}

ProcessUsage UsageOf(pid_t pid)
{
    ProcessUsage usage;
    for ([[maybe_unused]] const auto &entry :
         std::filesystem::directory_iterator("/proc/" + std::to_string(pid) + "/fd"))
        ++usage.descriptors;
    usage.threads = StatusField(pid, "Threads");
    usage.residentKiB = StatusField(pid, "VmRSS");
    return usage;
}

// A connection ends on the server's side a moment after the client has
// gone; wait for that, within a deadline.
template <typename Condition>
bool Eventually(Condition condition)
{
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (!condition()) {
        if (std::chrono::steady_clock::now() >= deadline)
            return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return true;
}

class ServerLoad : public reftest::ServerTest
{
};

TEST_F(ServerLoad, SixtyFourClientsForHalfAMinuteFailNothingAndLeakNothing)
{
    auto server = Start({"--portname", "Load"}, "Load");
    Sql("INSERT INTO element_counts VALUES (8, 4711)");
    const pid_t pid = server->Pid();
    const ProcessUsage before = UsageOf(pid);

    std::atomic<bool> stop{false};
    std::atomic<std::uint64_t> exchanges{0}, failures{0}, wrongAnswers{0};
    std::vector<std::thread> clients;
    for (int i = 0; i < kClients; ++i) {
        clients.emplace_back([&] {
            AccessRef access{CreateDirectStoreAccess(u"Load", 0)};
            while (!stop.load(std::memory_order_relaxed)) {
                const std::uint32_t count = access->GetElementCount(8);
                if (count == IDirectStoreAccess::kFailure)
                    ++failures;
                else if (count != 4711)
                    ++wrongAnswers;
                ++exchanges;
            }
        });
    }

    // Memory is compared between a quarter of the run, when every
    // connection is set up, and its end.
    std::this_thread::sleep_for(kDuration / 4);
    const ProcessUsage settled = UsageOf(pid);
    std::this_thread::sleep_for(kDuration - kDuration / 4);
    const ProcessUsage loaded = UsageOf(pid);
    stop = true;
    for (std::thread &client : clients)
        client.join();

    EXPECT_EQ(failures.load(), 0u);
    EXPECT_EQ(wrongAnswers.load(), 0u);
    EXPECT_GT(exchanges.load(), std::uint64_t(kClients) * 100) << "every client got its turns";
    EXPECT_EQ(settled.threads, before.threads + kClients) << "a thread per connection";
#if !defined(__SANITIZE_ADDRESS__)
    // AddressSanitizer keeps freed memory in quarantine: there it grows anyway.
    EXPECT_LT(loaded.residentKiB - settled.residentKiB, 4 * 1024)
        << "resident KiB went from " << settled.residentKiB << " to " << loaded.residentKiB;
#endif
    EXPECT_TRUE(Eventually([&] {
        const ProcessUsage after = UsageOf(pid);
        return after.threads == before.threads && after.descriptors == before.descriptors;
    })) << "threads " << before.threads << " -> " << UsageOf(pid).threads << ", descriptors " << before.descriptors
        << " -> " << UsageOf(pid).descriptors;
    std::cout << "exchanges: " << exchanges.load() << " in " << kDuration.count() << " s by " << kClients
              << " clients; server resident KiB " << before.residentKiB << " / " << settled.residentKiB << " / "
              << loaded.residentKiB << "\n";
}

} // namespace
