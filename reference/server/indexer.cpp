#include "reference/server/indexer.h"

#include "reference/libsupport/refobject.h"
#include "reference/server/schedule.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <stdexcept>

namespace sorvik::server {

namespace {

constexpr std::uint32_t kWatchMask = IN_CREATE | IN_CLOSE_WRITE | IN_MODIFY | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO |
                                     IN_DELETE_SELF | IN_MOVE_SELF | IN_ONLYDIR;

// The trigger events of the configuration (1 create, 2 modify, 4 delete,
// 8 rename) as inotify events.
std::uint32_t TriggeringEvents(std::int32_t events)
{
    std::uint32_t mask = IN_Q_OVERFLOW;
    if (events & 1)
        mask |= IN_CREATE;
    if (events & 2)
        mask |= IN_CLOSE_WRITE | IN_MODIFY;
    if (events & 4)
        mask |= IN_DELETE | IN_DELETE_SELF;
    if (events & 8)
        mask |= IN_MOVED_FROM | IN_MOVED_TO | IN_MOVE_SELF;
    return mask;
}

void Report(const std::string &text)
{
    std::fprintf(stderr, "Sorvik: %s\n", text.c_str());
}

void Drain(int eventFd)
{
    std::uint64_t count = 0;
    [[maybe_unused]] const ssize_t got = ::read(eventFd, &count, sizeof count);
}

} // namespace

IndexerSettings IndexerSettingsOf(const rovo::Settings &settings)
{
    IndexerSettings indexer;
    indexer.idleTime = std::chrono::seconds(settings.idleTime);
    indexer.fileTimeout = std::chrono::milliseconds(settings.fileTimeout);
    indexer.changeTrigger = settings.changeTrigger == 1;
    indexer.triggerEvents = settings.triggerEvents;
    indexer.scheduleKind = settings.scheduleKind;
    indexer.scheduleTime = settings.scheduleTime;
    return indexer;
}

Indexer::Indexer(IndexStatus &status, std::optional<std::chrono::seconds> idleOverride)
    : m_records(status), m_idleOverride(idleOverride)
{
    m_wake = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    m_notify = ::inotify_init1(IN_CLOEXEC | IN_NONBLOCK);
    if (m_wake < 0 || m_notify < 0)
        throw std::runtime_error("cannot create the indexer's events");
}

Indexer::~Indexer()
{
    Stop();
    ::close(m_notify);
    ::close(m_wake);
}

void Indexer::Start()
{
    m_thread = std::thread([this] { Run(); });
}

void Indexer::Stop()
{
    {
        std::lock_guard guard(m_lock);
        m_stopping = true;
    }
    Wake();
    if (m_thread.joinable())
        m_thread.join();
}

void Indexer::Wake()
{
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t written = ::write(m_wake, &one, sizeof one);
}

void Indexer::RequestLocked(Clock::time_point now)
{
    m_pending = true;
    m_requestedAt = now;
}

void Indexer::TakeUp(IndexPlan plan, const IndexerSettings &settings, bool indexAgain)
{
    const auto now = Clock::now();
    bool first;
    {
        std::lock_guard guard(m_lock);
        first = !m_configured;
    }
    // Outside the lock: it reads the index.
    const auto last = first ? m_records.Last() : std::nullopt;
    {
        std::lock_guard guard(m_lock);
        bool due = indexAgain;
        if (!m_configured) {
            // A missing or outdated index, or a schedule missed while the
            // server did not run; with the change trigger on, a walk sets
            // the watches.
            const auto missed = last ? NextScheduledRun(settings.scheduleKind, settings.scheduleTime,
                                                        QDateTime::fromMSecsSinceEpoch(last->endedMs, Qt::UTC))
                                     : std::nullopt;
            due = due || !last || last->planFingerprint != plan.Fingerprint() || settings.changeTrigger ||
                  (missed && *missed <= QDateTime::currentDateTimeUtc());
        } else {
            const bool planChanged = !(plan == m_plan);
            due = due || planChanged || (settings.changeTrigger && !m_settings.changeTrigger);
            m_abort = m_abort || planChanged;
        }
        const bool scheduleChanged = !m_configured || settings.scheduleKind != m_settings.scheduleKind ||
                                     rovo::FormatTime(settings.scheduleTime) != rovo::FormatTime(m_settings.scheduleTime);
        m_plan = std::move(plan);
        m_settings = settings;
        if (m_idleOverride)
            m_settings.idleTime = *m_idleOverride;
        if (scheduleChanged)
            m_nextScheduled = NextScheduledRun(m_settings.scheduleKind, m_settings.scheduleTime,
                                               QDateTime::currentDateTimeUtc());
        m_configured = true;
        if (due)
            RequestLocked(now);
    }
    Wake();
}

void Indexer::AbortPass()
{
    {
        std::lock_guard guard(m_lock);
        m_abort = true;
    }
    Wake();
}

Indexer::State Indexer::GetState() const
{
    std::lock_guard guard(m_lock);
    State state;
    state.done = m_progress.done.load();
    state.total = m_progress.total.load();
    state.lastMs = m_progress.lastMs.load();
    state.passes = m_passes;
    state.running = m_running;
    state.pending = m_pending;
    return state;
}

std::optional<Indexer::Clock::time_point> Indexer::DueLocked(Clock::time_point now)
{
    if (m_nextScheduled && *m_nextScheduled <= QDateTime::currentDateTimeUtc()) {
        RequestLocked(now);
        m_nextScheduled =
            NextScheduledRun(m_settings.scheduleKind, m_settings.scheduleTime, QDateTime::currentDateTimeUtc());
    }
    if (!m_pending)
        return std::nullopt;
    Clock::time_point quietSince = m_requestedAt;
    if (m_lastChange && *m_lastChange > quietSince)
        quietSince = *m_lastChange;
    return quietSince + m_settings.idleTime;
}

void Indexer::Run()
{
    std::unique_lock guard(m_lock);
    while (!m_stopping) {
        if (!m_settings.changeTrigger && !m_watches.empty()) {
            guard.unlock();
            DropWatches(true);
            guard.lock();
            continue;
        }
        const auto now = Clock::now();
        std::optional<Clock::time_point> until = DueLocked(now);
        if (until && *until <= now) {
            RunPass(guard);
            continue;
        }
        if (m_nextScheduled) {
            const auto scheduled =
                now + std::chrono::milliseconds(QDateTime::currentDateTimeUtc().msecsTo(*m_nextScheduled));
            if (!until || scheduled < *until)
                until = scheduled;
        }
        guard.unlock();
        const bool changes = WaitForWork(until);
        if (changes)
            TakeEvents();
        guard.lock();
    }
}

// Waits for the wake event, a change in a watched folder, or until; true
// when the folders changed.
bool Indexer::WaitForWork(std::optional<Clock::time_point> until)
{
    int timeout = -1;
    if (until) {
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(*until - Clock::now()).count();
        timeout = int(std::clamp<std::int64_t>(left, 0, 1 << 30));
    }
    pollfd waits[2] = {{m_wake, POLLIN, 0}, {m_notify, POLLIN, 0}};
    if (::poll(waits, 2, timeout) < 0 && errno != EINTR)
        throw std::runtime_error("the indexer cannot wait");
    if (waits[0].revents)
        Drain(m_wake);
    return waits[1].revents != 0;
}

// Reads the queued folder events; one that concerns a file some Parselet
// reads, or a folder, restarts the idle time and, with the change trigger
// on, makes indexing due.
void Indexer::TakeEvents()
{
    IndexPlan plan;
    std::uint32_t triggering;
    {
        std::lock_guard guard(m_lock);
        plan = m_plan;
        triggering = TriggeringEvents(m_settings.triggerEvents);
    }
    bool relevant = false;
    alignas(inotify_event) char events[8192];
    ssize_t got;
    while ((got = ::read(m_notify, events, sizeof events)) > 0) {
        for (ssize_t at = 0; at < got;) {
            const auto *event = reinterpret_cast<const inotify_event *>(events + at);
            at += ssize_t(sizeof(inotify_event) + event->len);
            if (event->mask & IN_IGNORED)
                m_watches.erase(event->wd);
            if ((event->mask & triggering) == 0)
                continue;
            const std::string_view name = event->len ? std::string_view(event->name) : std::string_view();
            if (event->mask & (IN_Q_OVERFLOW | IN_ISDIR | IN_DELETE_SELF | IN_MOVE_SELF) || plan.ParseletFor(name))
                relevant = true;
        }
    }
    if (!relevant)
        return;
    std::lock_guard guard(m_lock);
    const auto now = Clock::now();
    m_lastChange = now;
    if (m_settings.changeTrigger && !m_pending)
        RequestLocked(now);
}

bool Indexer::StopRequested()
{
    std::lock_guard guard(m_lock);
    return m_stopping || m_abort;
}

void Indexer::RunPass(std::unique_lock<std::mutex> &guard)
{
    const IndexPlan plan = m_plan;
    const IndexerSettings settings = m_settings;
    m_pending = false;
    m_abort = false;
    m_running = true;
    m_lastChange.reset();
    guard.unlock();

    IndexPass::Hooks hooks;
    hooks.stopRequested = [this] { return StopRequested(); };
    hooks.interruption.wakeFd = m_wake;
    hooks.interruption.stopRequested = [this] {
        Drain(m_wake);
        return StopRequested();
    };
    if (settings.changeTrigger)
        hooks.walkedFolder = [this](const std::string &folder) { WatchFolder(folder); };
    m_walkedWatches.clear();

    PassSummary summary;
    try {
        summary = IndexPass(m_records, plan, settings.fileTimeout, std::move(hooks), m_progress).Run();
    } catch (const ref::Failure &failure) {
        Report("indexing failed: " + QString::fromStdU16String(failure.text).toStdString());
    } catch (const std::exception &failure) {
        Report(std::string("indexing failed: ") + failure.what());
    }
    if (summary.completed) {
        if (settings.changeTrigger)
            DropWatches(false);
        std::printf("indexed: %u files, %u read, %u indexed, %u timed out, %u failed, %u removed in %lld ms\n",
                    summary.files, summary.read, summary.indexed, summary.timedOut, summary.failed, summary.removed,
                    static_cast<long long>(summary.took.count()));
        std::fflush(stdout);
    } else {
        m_progress.total.store(m_progress.done.load());
    }

    guard.lock();
    m_running = false;
    if (summary.completed)
        ++m_passes;
}

void Indexer::WatchFolder(const std::string &folder)
{
    const int wd = ::inotify_add_watch(m_notify, folder.c_str(), kWatchMask);
    if (wd >= 0) {
        m_watches.insert(wd);
        m_walkedWatches.insert(wd);
    } else if (errno == ENOSPC && !m_watchesFull) {
        m_watchesFull = true;
        Report("no more folders can be watched (fs.inotify.max_user_watches): changes below " + folder +
               " are seen by the next indexing only");
    }
}

// Drops the watches of folders the last walk did not visit, or all.
void Indexer::DropWatches(bool all)
{
    for (auto it = m_watches.begin(); it != m_watches.end();) {
        if (all || !m_walkedWatches.count(*it)) {
            ::inotify_rm_watch(m_notify, *it);
            it = m_watches.erase(it);
        } else {
            ++it;
        }
    }
    if (all) {
        // Events of the dropped watches mean nothing now.
        alignas(inotify_event) char events[4096];
        while (::read(m_notify, events, sizeof events) > 0) {
        }
    }
}

} // namespace sorvik::server
