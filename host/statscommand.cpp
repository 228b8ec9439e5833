// sorvik-config stats [--portname NAME] [--identification TEXT --secretkey KEY] [--wait]
//
// Asks a running server instance for every statistic of the direct store
// access and prints one "name: value" line each; with --wait it then blocks
// until the instance ends.

#include "dunemere/directstoreaccess.h"
#include "host/subcommand.h"
#include "sorvik/vekexception.h"
#include "sorvik/wstringqt.h"

#include <condition_variable>
#include <cstdio>
#include <mutex>
#include <vector>

namespace host {

namespace {

using cv::vek::rovo::dunemere::IDirectStoreAccess;
using cv::vek::rovo::dunemere::IServerStoppedCallback;

constexpr std::uint32_t kMaxParselets = 4096;

struct StatsOptions
{
    QString portName;
    QString identification;
    QString secretKey;
    bool wait = false;
};

std::optional<StatsOptions> ParseStatsOptions(const QStringList &arguments)
{
    StatsOptions options;
    for (qsizetype i = 0; i < arguments.size(); ++i) {
        const QString &option = arguments[i];
        if (option == QLatin1String("--wait")) {
            options.wait = true;
            continue;
        }
        QString *value = option == QLatin1String("--portname")         ? &options.portName
                         : option == QLatin1String("--identification") ? &options.identification
                         : option == QLatin1String("--secretkey")      ? &options.secretKey
                                                                       : nullptr;
        if (!value || i + 1 >= arguments.size()) {
            std::fprintf(stderr, "sorvik-config stats: %s %s\n", qUtf8Printable(option),
                         value ? "needs a value" : "is not an option of stats");
            return std::nullopt;
        }
        *value = arguments[++i];
    }
    if (options.identification.isEmpty() != options.secretKey.isEmpty()) {
        std::fprintf(stderr, "sorvik-config stats: --identification and --secretkey go together\n");
        return std::nullopt;
    }
    return options;
}

// Wakes the waiting command when the instance has ended.
class StoppedSignal final : public IServerStoppedCallback
{
public:
    HRESULT QueryInterface(REFIID iid, void **object) override
    {
        if (!object)
            return E_POINTER;
        *object = iid == IID_IUnknown ? this : nullptr;
        if (!*object)
            return E_NOINTERFACE;
        AddRef();
        return S_OK;
    }
    // Lives on the command's stack; the count only keeps the contract.
    ULONG AddRef() override { return ++m_refs; }
    ULONG Release() override { return --m_refs; }
    void OnServerStopped() override
    {
        std::lock_guard lock(m_lock);
        m_stopped = true;
        m_changed.notify_all();
    }
    void Wait()
    {
        std::unique_lock lock(m_lock);
        m_changed.wait(lock, [this] { return m_stopped; });
    }

private:
    std::atomic<ULONG> m_refs{1};
    std::mutex m_lock;
    std::condition_variable m_changed;
    bool m_stopped = false;
};

void PrintValue(const char *name, std::uint32_t value)
{
    std::printf("%s: %u\n", name, unsigned(value));
}

void PrintStatistics(IDirectStoreAccess &access)
{
    PrintValue("GetUserCount(0)", access.GetUserCount(0));
    for (std::uint32_t kind : {8u, 16u, 32u})
        std::printf("GetElementCount(%u): %u\n", unsigned(kind), unsigned(access.GetElementCount(kind)));
    std::printf("GetDiskIsFullCrawlStop: %s\n", access.GetDiskIsFullCrawlStop() ? "true" : "false");
    PrintValue("GetFileviewsTimeouted", access.GetFileviewsTimeouted());

    std::uint32_t total = IDirectStoreAccess::kFailure;
    access.GetFileviewsTimeoutedPerPlugIn(0, nullptr, nullptr, &total);
    PrintValue("GetFileviewsTimeoutedPerPlugIn", total);
    if (total == IDirectStoreAccess::kFailure || total == 0)
        return;
    const std::uint32_t capacity = std::min(total, kMaxParselets);
    std::vector<std::u16string> names(capacity);
    std::vector<std::uint32_t> counts(capacity);
    access.GetFileviewsTimeoutedPerPlugIn(capacity, names.data(), counts.data(), &total);
    for (std::uint32_t i = 0; i < std::min(total, capacity); ++i)
        std::printf("GetFileviewsTimeoutedPerPlugIn(%s): %u\n", qUtf8Printable(QString::fromStdU16String(names[i])),
                    unsigned(counts[i]));
}

} // namespace

int RunStats(SubcommandContext &context)
{
    return RunStats(context.arguments);
}

int RunStats(const QStringList &arguments)
{
    const auto options = ParseStatsOptions(arguments);
    if (!options)
        return kExitUsage;

    IDirectStoreAccess *access = nullptr;
    try {
        const std::u16string portName = options->portName.toStdU16String();
        access = options->identification.isEmpty()
                     ? cv::vek::rovo::dunemere::CreateDirectStoreAccess(portName, 0)
                     : cv::vek::rovo::dunemere::CreateDirectStoreAccessWithIdentification(
                           portName, 0, options->identification.toStdU16String(), options->secretKey.toStdU16String());
    } catch (const cv::vek::Exception &error) {
        std::fprintf(stderr, "sorvik-config stats: %s (%d)\n", qUtf8Printable(cv::krn::ToQString(error.Message())),
                     int(error.Code()));
        return kExitFailed;
    }

    // The user count is asked first: it also connects and logs on.
    const bool answered = access->GetUserCount(0) != IDirectStoreAccess::kFailure;
    if (!answered) {
        std::fprintf(stderr, "sorvik-config stats: the server instance did not answer\n");
        access->Release();
        return kExitFailed;
    }
    PrintStatistics(*access);
    std::fflush(stdout);

    StoppedSignal stopped;
    if (options->wait) {
        access->StartStopWaitThread(&stopped);
        stopped.Wait();
        std::printf("stopped: %s\n", qUtf8Printable(options->portName));
    }
    // Releasing waits for the stop-and-wait thread, which has ended by now.
    access->Release();
    return kExitDone;
}

} // namespace host
