#include "reference/server/configapplier.h"

#include "reference/libsupport/refobject.h"

#include <QFile>
#include <QFileInfo>

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <stdexcept>
#include <string_view>

namespace sorvik::server {

namespace {

// The commit marker is written and closed, or put in place.
constexpr std::uint32_t kWatchedEvents = IN_CLOSE_WRITE | IN_MOVED_TO;

bool PollIn(pollfd *waits, nfds_t count, int timeoutMs)
{
    for (;;) {
        const int ready = ::poll(waits, count, timeoutMs);
        if (ready >= 0)
            return ready > 0;
        if (errno != EINTR)
            throw std::runtime_error("poll failed");
    }
}

void Signal(int eventFd)
{
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t written = ::write(eventFd, &one, sizeof one);
}

void Drain(int eventFd)
{
    std::uint64_t count = 0;
    [[maybe_unused]] const ssize_t got = ::read(eventFd, &count, sizeof count);
}

void Report(const QString &text)
{
    std::fprintf(stderr, "Sorvik: %s\n", text.toLocal8Bit().constData());
}

} // namespace

ConfigApplier::ConfigApplier(const QString &storeFile, std::chrono::milliseconds applyDelay)
    : m_storeFile(storeFile), m_applyDelay(applyDelay)
{
    m_stop = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    m_poke = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    m_watch = ::inotify_init1(IN_CLOEXEC | IN_NONBLOCK);
    if (m_stop < 0 || m_poke < 0 || m_watch < 0)
        throw std::runtime_error("cannot create the store watch");
    m_db = rovo::OpenStore(storeFile, true);
    // Watching comes before the first read, so no commit falls between them.
    const QByteArray folder = QFile::encodeName(QFileInfo(storeFile).absolutePath());
    if (::inotify_add_watch(m_watch, folder.constData(), kWatchedEvents) < 0)
        throw std::runtime_error("cannot watch the store folder " + folder.toStdString());
}

ConfigApplier::~ConfigApplier()
{
    Stop();
    ::close(m_watch);
    ::close(m_poke);
    ::close(m_stop);
}

rovo::Settings ConfigApplier::CommittedSettings()
{
    std::lock_guard guard(m_db->Lock());
    rovo::Transaction read(*m_db, rovo::Transaction::Kind::Read, cv::rovo::status::StoreUnavailable);
    return rovo::ReadSettings(*m_db);
}

void ConfigApplier::Start(std::int64_t lastRequest, TakeUp takeUp)
{
    m_takeUp = std::move(takeUp);
    m_lastRequest = lastRequest;
    const CommittedConfiguration committed = ReadCommitted();
    m_takeUp(committed);
    if (!committed.requests.empty())
        m_lastRequest = committed.requests.back().id;
    Publish(committed.generation, {});
    m_thread = std::thread([this] { Run(); });
}

void ConfigApplier::Stop()
{
    if (!m_thread.joinable())
        return;
    Signal(m_stop);
    m_thread.join();
}

void ConfigApplier::Poke()
{
    Signal(m_poke);
}

void ConfigApplier::Run()
{
    pollfd waits[3] = {{m_watch, POLLIN, 0}, {m_poke, POLLIN, 0}, {m_stop, POLLIN, 0}};
    try {
        while (PollIn(waits, 3, -1) && waits[2].revents == 0) {
            const bool poked = waits[1].revents != 0;
            if (poked)
                Drain(m_poke);
            if (CommitSeen() || poked)
                TakeUpPending();
        }
    } catch (const std::exception &failure) {
        Report(QStringLiteral("no longer takes up commits: %1").arg(QString::fromLocal8Bit(failure.what())));
    }
}

// Reads every queued event; true when one concerns the commit marker.
bool ConfigApplier::CommitSeen()
{
    const QByteArray marker = QFile::encodeName(QFileInfo(rovo::CommitMarkerFile(m_storeFile)).fileName());
    bool seen = false;
    alignas(inotify_event) char events[4096];
    ssize_t got;
    while ((got = ::read(m_watch, events, sizeof events)) > 0) {
        for (ssize_t at = 0; at < got;) {
            const auto *event = reinterpret_cast<const inotify_event *>(events + at);
            const std::string_view name = event->len ? std::string_view(event->name) : std::string_view();
            if (event->mask & IN_Q_OVERFLOW || name == marker.constData())
                seen = true;
            at += ssize_t(sizeof(inotify_event) + event->len);
        }
    }
    return seen;
}

void ConfigApplier::TakeUpPending()
{
    for (;;) {
        CommittedConfiguration committed;
        try {
            committed = ReadCommitted();
        } catch (const ref::Failure &failure) {
            // The next commit tries again.
            Report(QStringLiteral("cannot read the committed configuration: %1").arg(QString::fromStdU16String(failure.text)));
            return;
        }
        if (committed.generation <= Applied())
            return;
        if (!SpendApplyDelay())
            return;
        QString failure;
        try {
            m_takeUp(committed);
        } catch (const ref::Failure &error) {
            failure = QString::fromStdU16String(error.text);
        } catch (const std::exception &error) {
            failure = QString::fromLocal8Bit(error.what());
        }
        if (!failure.isEmpty())
            Report(QStringLiteral("taking up configuration %1 failed: %2").arg(committed.generation).arg(failure));
        if (!committed.requests.empty())
            m_lastRequest = committed.requests.back().id;
        Publish(committed.generation, failure);
    }
}

CommittedConfiguration ConfigApplier::ReadCommitted()
{
    std::lock_guard guard(m_db->Lock());
    rovo::Transaction read(*m_db, rovo::Transaction::Kind::Read, cv::rovo::status::StoreUnavailable);
    CommittedConfiguration committed;
    committed.generation = rovo::ConfigGeneration(*m_db);
    if (committed.generation > Applied()) {
        committed.configuration = rovo::ReadConfiguration(*m_db);
        committed.requests = rovo::ReadRequests(*m_db, m_lastRequest);
    }
    return committed;
}

// True when the delay passed, false when the server stops meanwhile.
bool ConfigApplier::SpendApplyDelay()
{
    if (m_applyDelay.count() == 0)
        return true;
    pollfd stop = {m_stop, POLLIN, 0};
    return !PollIn(&stop, 1, int(m_applyDelay.count()));
}

void ConfigApplier::Publish(std::int64_t generation, QString failure)
{
    std::lock_guard guard(m_lock);
    m_applied = generation;
    m_failure = std::move(failure);
    for (const int waiter : m_waiters)
        Signal(waiter);
}

ConfigApplier::Wait ConfigApplier::WaitUntilApplied(std::int64_t generation, std::span<const int> cancel)
{
    const int wake = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (wake < 0)
        throw std::runtime_error("cannot create an event");
    {
        std::lock_guard guard(m_lock);
        m_waiters.insert(wake);
    }
    struct Unregister
    {
        ConfigApplier &applier;
        int wake;
        ~Unregister()
        {
            {
                std::lock_guard guard(applier.m_lock);
                applier.m_waiters.erase(wake);
            }
            ::close(wake);
        }
    } unregister{*this, wake};

    std::vector<pollfd> waits{{wake, POLLIN, 0}};
    for (const int fd : cancel)
        waits.push_back({fd, POLLIN, 0});
    for (;;) {
        {
            std::lock_guard guard(m_lock);
            if (m_applied >= generation)
                return m_failure.isEmpty() ? Wait::Applied : Wait::Failed;
        }
        PollIn(waits.data(), waits.size(), -1);
        for (std::size_t i = 1; i < waits.size(); ++i) {
            if (waits[i].revents != 0)
                return Wait::Cancelled;
        }
        Drain(wake);
    }
}

std::int64_t ConfigApplier::Applied() const
{
    std::lock_guard guard(m_lock);
    return m_applied;
}

QString ConfigApplier::Failure() const
{
    std::lock_guard guard(m_lock);
    return m_failure;
}

std::size_t ConfigApplier::Waiting() const
{
    std::lock_guard guard(m_lock);
    return m_waiters.size();
}

} // namespace sorvik::server
