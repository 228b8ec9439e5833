#include "reference/server/indexstatus.h"

#include "sorvik/rovoapi.h"

#include <QDir>
#include <QFile>

#include <sys/inotify.h>
#include <unistd.h>

#include <algorithm>
#include <limits>

namespace sorvik::server {

namespace {

constexpr int kBusyMilliseconds = 5000;

std::uint32_t Clamped(std::int64_t value)
{
    return std::uint32_t(std::clamp<std::int64_t>(value, 0, std::numeric_limits<std::uint32_t>::max() - 1));
}

} // namespace

QString IndexStatus::FileIn(const QString &indexFolder)
{
    return QDir(indexFolder).filePath(QStringLiteral("status.sqlite"));
}

IndexStatus::IndexStatus(const QString &indexFolder)
    : m_db((QDir().mkpath(indexFolder), FileIn(indexFolder)), true, kBusyMilliseconds)
{
    m_db.Exec("PRAGMA journal_mode=WAL");
    m_db.Exec("CREATE TABLE IF NOT EXISTS element_counts(kind INTEGER PRIMARY KEY, count INTEGER NOT NULL)");
    m_db.Exec("CREATE TABLE IF NOT EXISTS counters(name TEXT PRIMARY KEY, value INTEGER NOT NULL)");
    m_db.Exec("CREATE TABLE IF NOT EXISTS parselet_timeouts(parselet TEXT PRIMARY KEY, count INTEGER NOT NULL)");

    m_changes = ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC);
    if (m_changes >= 0 &&
        ::inotify_add_watch(m_changes, QFile::encodeName(indexFolder).constData(),
                            IN_MODIFY | IN_CREATE | IN_DELETE | IN_MOVED_TO | IN_MOVED_FROM) < 0) {
        ::close(m_changes);
        m_changes = -1;
    }
}

IndexStatus::~IndexStatus()
{
    if (m_changes >= 0)
        ::close(m_changes);
}

// True when the status file or its write-ahead log was written since the
// last call, or when that cannot be told. Readers touch only the shared
// memory file, so the server's own queries do not count.
bool IndexStatus::FolderChanged()
{
    if (m_changes < 0)
        return true;
    bool changed = false;
    alignas(inotify_event) char events[4096];
    ssize_t got;
    while ((got = ::read(m_changes, events, sizeof events)) > 0) {
        for (ssize_t at = 0; at < got;) {
            const auto *event = reinterpret_cast<const inotify_event *>(events + at);
            const std::string_view name = event->len ? std::string_view(event->name) : std::string_view();
            if (event->mask & IN_Q_OVERFLOW || name == "status.sqlite" || name == "status.sqlite-wal")
                changed = true;
            at += ssize_t(sizeof(inotify_event) + event->len);
        }
    }
    return changed;
}

std::uint32_t IndexStatus::ElementCount(std::uint32_t kind)
{
    std::lock_guard lock(m_lock);
    if (FolderChanged() || !m_elementCountsValid) {
        m_elementCounts.clear();
        rovo::Statement query(m_db, "SELECT kind, count FROM element_counts");
        while (query.Step())
            m_elementCounts[std::uint32_t(query.Int(0))] = Clamped(query.Int(1));
        m_elementCountsValid = true;
    }
    const auto found = m_elementCounts.find(kind);
    return found == m_elementCounts.end() ? 0 : found->second;
}

std::uint32_t IndexStatus::Counter(const char *name)
{
    return Clamped(Value(name));
}

std::int64_t IndexStatus::Value(const char *name)
{
    rovo::Statement query(m_db, "SELECT value FROM counters WHERE name = ?1");
    query.Bind(1, QString::fromLatin1(name));
    return query.Step() ? query.Int(0) : 0;
}

void IndexStatus::SetCounter(const char *name, std::int64_t value)
{
    rovo::Statement update(m_db, "INSERT INTO counters(name, value) VALUES(?1, ?2) "
                                 "ON CONFLICT(name) DO UPDATE SET value = excluded.value");
    update.Bind(1, QString::fromLatin1(name)).Bind(2, value).Run();
}

bool IndexStatus::DiskIsFullCrawlStop()
{
    std::lock_guard lock(m_lock);
    return Counter("disk_full_crawl_stop") != 0;
}

std::uint32_t IndexStatus::FileviewsTimeouted()
{
    std::lock_guard lock(m_lock);
    rovo::Statement query(m_db, "SELECT total(count) FROM parselet_timeouts");
    return query.Step() ? Clamped(query.Int(0)) : 0;
}

IndexStatus::PerParselet IndexStatus::FileviewsTimeoutedPerParselet()
{
    std::lock_guard lock(m_lock);
    PerParselet result;
    rovo::Statement query(m_db, "SELECT parselet, count FROM parselet_timeouts WHERE count > 0 ORDER BY parselet");
    while (query.Step()) {
        ++result.entries;
        result.text += query.Text(0).toStdU16String();
        result.text += u'$';
        result.text += QString::number(Clamped(query.Int(1))).toStdU16String();
        result.text += u';';
    }
    return result;
}

void IndexStatus::ResetTimeouted()
{
    std::lock_guard lock(m_lock);
    m_db.Exec("DELETE FROM parselet_timeouts");
}

void IndexStatus::ResetFailure()
{
    std::lock_guard lock(m_lock);
    SetCounter("failures", 0);
}

void IndexStatus::ResetNotMyFile()
{
    std::lock_guard lock(m_lock);
    SetCounter("not_my_file", 0);
}

void IndexStatus::ResetIndex()
{
    std::lock_guard lock(m_lock);
    rovo::Transaction transaction(m_db, rovo::Transaction::Kind::Write, cv::rovo::status::StoreUnavailable);
    m_db.Exec("DELETE FROM element_counts;"
              "DELETE FROM parselet_timeouts;"
              "UPDATE counters SET value = 0 WHERE name IN ('disk_full_crawl_stop', 'failures', 'not_my_file')");
    transaction.Commit();
}

std::int64_t IndexStatus::AppliedRequest()
{
    std::lock_guard lock(m_lock);
    return Value("applied_request");
}

void IndexStatus::RecordApplied(std::int64_t generation, std::int64_t request)
{
    std::lock_guard lock(m_lock);
    rovo::Transaction transaction(m_db, rovo::Transaction::Kind::Write, cv::rovo::status::StoreUnavailable);
    SetCounter("applied_generation", generation);
    SetCounter("applied_request", request);
    transaction.Commit();
}

} // namespace sorvik::server
