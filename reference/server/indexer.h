#pragma once

#include "reference/server/indexpass.h"
#include "reference/server/indexplan.h"
#include "reference/server/indexrecords.h"

#include <QDateTime>

#include <chrono>
#include <cstdint>
#include <mutex>
#include <optional>
#include <set>
#include <thread>

namespace sorvik::server {

// The settings of the committed configuration that rule when and how the
// server indexes.
struct IndexerSettings
{
    std::chrono::seconds idleTime{60};
    std::chrono::milliseconds fileTimeout{60000};
    bool changeTrigger = true;
    std::int32_t triggerEvents = 15; // 1 create, 2 modify, 4 delete, 8 rename
    std::int32_t scheduleKind = 0;
    cv::rovo::CalendarTime scheduleTime{};
};

// The server's indexer: one worker thread that runs a pass (indexpass.h)
// whenever indexing is due, and only once the idle time has passed without
// further changes. Indexing is due when the server starts with a missing or
// outdated index (or watches for changes, which needs a walk), when a
// commit changes what is to be indexed or asks for indexing, on the
// schedule, and, with the change trigger on, when files in the search areas
// are created, changed, removed or renamed (inotify on every folder walked).
// Nothing here blocks a caller: the worker reads files with a deadline and
// writes the index under its own short locks.
class Indexer
{
public:
    // idleOverride replaces the configured idle time (the server's
    // --idle-seconds).
    Indexer(IndexStatus &status, std::optional<std::chrono::seconds> idleOverride);
    ~Indexer();

    Indexer(const Indexer &) = delete;
    Indexer &operator=(const Indexer &) = delete;

    // Every configuration the server takes up, the first before Start.
    // indexAgain: the commit asked for indexing (a start-indexing or reindex
    // request, a reset).
    void TakeUp(IndexPlan plan, const IndexerSettings &settings, bool indexAgain);
    // A pass in progress ends at once (after a reset of the index).
    void AbortPass();

    void Start();
    void Stop();

    struct State
    {
        std::uint32_t done = 0;
        std::uint32_t total = 0;
        std::int64_t lastMs = -1;  // ms since 1970 of the last progress; -1: none yet
        std::uint64_t passes = 0;  // completed since the server started
        bool running = false;
        bool pending = false;      // due once the idle time has passed
    };
    State GetState() const;

private:
    using Clock = std::chrono::steady_clock;

    void Run();
    // With the lock held: when the next pass is due, or nothing.
    std::optional<Clock::time_point> DueLocked(Clock::time_point now);
    void RunPass(std::unique_lock<std::mutex> &guard);
    bool WaitForWork(std::optional<Clock::time_point> until);
    void TakeEvents();
    bool StopRequested();
    void WatchFolder(const std::string &folder);
    void DropWatches(bool all);
    void RequestLocked(Clock::time_point now);
    void Wake();

    IndexRecords m_records;
    const std::optional<std::chrono::seconds> m_idleOverride;
    IndexProgress m_progress;
    int m_wake = -1;   // eventfd: look at the state again
    int m_notify = -1; // inotify on the folders of the search areas
    std::thread m_thread;

    mutable std::mutex m_lock;
    IndexPlan m_plan;
    IndexerSettings m_settings;
    bool m_configured = false;
    bool m_stopping = false;
    bool m_abort = false;
    bool m_running = false;
    bool m_pending = false;
    Clock::time_point m_requestedAt;
    std::optional<Clock::time_point> m_lastChange;
    std::optional<QDateTime> m_nextScheduled;
    std::uint64_t m_passes = 0;

    // The worker's own.
    std::set<int> m_watches, m_walkedWatches;
    bool m_watchesFull = false;
};

IndexerSettings IndexerSettingsOf(const rovo::Settings &settings);

} // namespace sorvik::server
