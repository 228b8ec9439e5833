// One GetElementCount through direct store access, requestor, comm library
// and the reference server process, beside a raw Unix-domain socket
// ping-pong with another process using frames of the same sizes (with and
// without a time-out on the wait for the answer); and the server's
// throughput and tail latency with 64 clients at once beside one client.

#include "dunemere/directstoreaccess.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferdata.h"
#include "support/sorvikprocess.h"

#include <benchmark/benchmark.h>

#include <poll.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <thread>
#include <vector>

namespace {

using namespace cv::vek::rovo;

std::filesystem::path MakeScratch()
{
    char pattern[] = "/tmp/sorvik-bench-XXXXXX";
    const char *made = ::mkdtemp(pattern);
    if (!made)
        std::abort();
    return made;
}

// The private folders and the running server, for the whole run.
struct Setting
{
    Setting() : scratch(MakeScratch())
    {
        ::setenv("CORVANE_REGISTRY", SORVIK_REFERENCE_REGISTRY, 1);
        ::setenv("CORVANE_SORVIK_STORE", (scratch / "store").c_str(), 1);
        ::setenv("CORVANE_RUNTIME_DIR", (scratch / "run").c_str(), 1);
        ::setenv("CORVANE_MUTEX_DIR", (scratch / "mutex").c_str(), 1);
        server = std::make_unique<testsupport::SorvikProcess>(SORVIK_SERVER, std::vector<std::string>{"--portname", "Bench"});
        if (!server->WaitUntilServing("Bench"))
            std::abort();
    }
    ~Setting()
    {
        server.reset();
        std::filesystem::remove_all(scratch);
    }

    std::filesystem::path scratch;
    std::unique_ptr<testsupport::SorvikProcess> server;
};

Setting &Shared()
{
    static Setting setting;
    return setting;
}

// CPU time a process's threads have used so far. On a busy machine the wall
// time of an exchange says more about the neighbours than about the code;
// the CPU both ends spend on it does not.
double CpuNanoseconds(pid_t pid)
{
    double total = 0;
    std::error_code error;
    for (const auto &task : std::filesystem::directory_iterator("/proc/" + std::to_string(pid) + "/task", error)) {
        std::ifstream schedstat(task.path() / "schedstat");
        double onCpu = 0;
        if (schedstat >> onCpu)
            total += onCpu;
    }
    return total;
}

// The other end's CPU per exchange, beside the benchmark's own CPU column.
class PeerCpu
{
public:
    explicit PeerCpu(pid_t pid) : m_pid(pid), m_start(CpuNanoseconds(pid)) {}
    void Report(benchmark::State &state) const
    {
        state.counters["peer_cpu_ns"] =
            benchmark::Counter(CpuNanoseconds(m_pid) - m_start, benchmark::Counter::kAvgIterations);
    }

private:
    pid_t m_pid;
    double m_start;
};

void GetElementCount_DirectStoreAccess(benchmark::State &state)
{
    Shared();
    auto *access = dunemere::CreateDirectStoreAccess(u"Bench", 0);
    if (access->GetElementCount(8) == dunemere::IDirectStoreAccess::kFailure) {
        state.SkipWithError("the reference server does not answer");
        access->Release();
        return;
    }
    const PeerCpu server(Shared().server->Pid());
    for (auto _ : state)
        benchmark::DoNotOptimize(access->GetElementCount(8));
    server.Report(state);
    access->Release();
}

// The same path without the server's status store.
void GetUserCount_DirectStoreAccess(benchmark::State &state)
{
    Shared();
    auto *access = dunemere::CreateDirectStoreAccess(u"Bench", 0);
    const PeerCpu server(Shared().server->Pid());
    for (auto _ : state)
        benchmark::DoNotOptimize(access->GetUserCount(0));
    server.Report(state);
    access->Release();
}

// Clients asking statistics as fast as they can for a fixed window, each
// through its own direct store access (its own connection and server
// thread): exchanges per second over all, and the 99th percentile of one
// exchange's latency. One client is the baseline for 64.
void GetElementCount_ConcurrentClients(benchmark::State &state)
{
    using Clock = std::chrono::steady_clock;
    Shared();
    const auto clients = static_cast<std::size_t>(state.range(0));
    std::vector<dunemere::IDirectStoreAccess *> accesses;
    for (std::size_t i = 0; i < clients; ++i) {
        accesses.push_back(dunemere::CreateDirectStoreAccess(u"Bench", 0));
        accesses.back()->GetElementCount(8); // connects and logs on
    }
    std::uint64_t exchanges = 0, failures = 0;
    double p99Microseconds = 0;
    double seconds = 0;
    for (auto _ : state) {
        std::atomic<bool> stop{false};
        std::vector<std::vector<std::uint32_t>> latencies(clients);
        std::atomic<std::uint64_t> failed{0};
        std::vector<std::thread> threads;
        const auto start = Clock::now();
        for (std::size_t i = 0; i < clients; ++i) {
            threads.emplace_back([&, i] {
                latencies[i].reserve(1 << 20);
                while (!stop.load(std::memory_order_relaxed)) {
                    const auto before = Clock::now();
                    if (accesses[i]->GetElementCount(8) == dunemere::IDirectStoreAccess::kFailure)
                        ++failed;
                    latencies[i].push_back(std::uint32_t(
                        std::chrono::duration_cast<std::chrono::nanoseconds>(Clock::now() - before).count()));
                }
            });
        }
        std::this_thread::sleep_for(std::chrono::seconds(3));
        stop = true;
        for (std::thread &thread : threads)
            thread.join();
        seconds = std::chrono::duration<double>(Clock::now() - start).count();
        state.SetIterationTime(seconds);

        std::vector<std::uint32_t> all;
        for (const auto &one : latencies)
            all.insert(all.end(), one.begin(), one.end());
        exchanges = all.size();
        failures = failed.load();
        if (!all.empty()) {
            const auto at = all.begin() + std::ptrdiff_t(all.size() * 99 / 100);
            std::nth_element(all.begin(), at, all.end());
            p99Microseconds = *at / 1000.0;
        }
    }
    for (auto *access : accesses)
        access->Release();
    state.counters["exchanges_per_s"] = double(exchanges) / seconds;
    state.counters["p99_us"] = p99Microseconds;
    state.counters["failed"] = double(failures);
}

bool Transfer(int fd, std::uint8_t *bytes, std::size_t size, bool write)
{
    std::size_t done = 0;
    while (done < size) {
        const ssize_t n = write ? ::send(fd, bytes + done, size - done, MSG_NOSIGNAL) : ::read(fd, bytes + done, size - done);
        if (n <= 0)
            return false;
        done += std::size_t(n);
    }
    return true;
}

// The client side waits for each answer with poll and a time-out, as any
// client that must not hang does, or blocks in read without one.
void PingPong(benchmark::State &state, bool withTimeout)
{
    // Frame sizes: the record and its four-byte length.
    const tRequestTransferData request(kClientVersion, 5, 4002);
    cv::krn::ByteBuffer record;
    request.Serialize(record);
    const std::size_t requestSize = 4 + record.size();
    record.clear();
    tResponseTransferData(request.RequestIdentifier(), 0, 0).Serialize(record);
    const std::size_t responseSize = 4 + record.size();

    int pair[2];
    if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair) != 0) {
        state.SkipWithError("no socket pair");
        return;
    }
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(pair[0]);
        std::vector<std::uint8_t> in(requestSize), out(responseSize);
        while (Transfer(pair[1], in.data(), in.size(), false) && Transfer(pair[1], out.data(), out.size(), true)) {
        }
        ::_exit(0);
    }
    ::close(pair[1]);
    std::vector<std::uint8_t> out(requestSize), in(responseSize);
    const PeerCpu peer(child);
    for (auto _ : state) {
        Transfer(pair[0], out.data(), out.size(), true);
        if (withTimeout) {
            pollfd ready{pair[0], POLLIN, 0};
            ::poll(&ready, 1, 20000);
        }
        Transfer(pair[0], in.data(), in.size(), false);
    }
    peer.Report(state);
    ::close(pair[0]);
    ::waitpid(child, nullptr, 0);
}

void RawSocketPingPong(benchmark::State &state)
{
    PingPong(state, false);
}

void RawSocketPingPongWithTimeout(benchmark::State &state)
{
    PingPong(state, true);
}

BENCHMARK(GetElementCount_DirectStoreAccess)->Repetitions(9)->ReportAggregatesOnly(true)->UseRealTime();
BENCHMARK(GetUserCount_DirectStoreAccess)->Repetitions(9)->ReportAggregatesOnly(true)->UseRealTime();
BENCHMARK(GetElementCount_ConcurrentClients)->Arg(1)->Arg(64)->Iterations(1)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(RawSocketPingPong)->Repetitions(9)->ReportAggregatesOnly(true)->UseRealTime();
BENCHMARK(RawSocketPingPongWithTimeout)->Repetitions(9)->ReportAggregatesOnly(true)->UseRealTime();

} // namespace

BENCHMARK_MAIN();
