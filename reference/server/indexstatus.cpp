#include "reference/server/indexstatus.h"

#include "reference/libsupport/refobject.h"
#include "sorvik/rovoapi.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <sys/inotify.h>
#include <unistd.h>

#include <algorithm>
#include <limits>

namespace sorvik::server {

namespace {

constexpr int kBusyMilliseconds = 5000;

const char *const kStatusSuffixes[] = {"", "-wal", "-shm"};

const char *const kSchema[] = {
    "CREATE TABLE IF NOT EXISTS element_counts(kind INTEGER PRIMARY KEY, count INTEGER NOT NULL)",
    "CREATE TABLE IF NOT EXISTS counters(name TEXT PRIMARY KEY, value INTEGER NOT NULL)",
    "CREATE TABLE IF NOT EXISTS parselet_timeouts(parselet TEXT PRIMARY KEY, count INTEGER NOT NULL)",
    // One row per file the indexer looked at. outcome: 0 indexed, 1 timed
    // out, 2 failed (detail says why); mtime -1 asks for reading it again.
    // properties: the properties of its elements as a JSON array of
    // [level, element, name, value, type], level 0 the file, 1 the channel
    // group, 2 a channel (element: its position); type 0 integer, 1 numeric,
    // 2 time, 3 string. One row per file keeps indexing fast; json_each()
    // reads them.
    "CREATE TABLE IF NOT EXISTS files(path TEXT PRIMARY KEY, size INTEGER NOT NULL, mtime INTEGER NOT NULL,"
    " parselet TEXT NOT NULL, outcome INTEGER NOT NULL, channels INTEGER NOT NULL, detail TEXT NOT NULL,"
    " properties TEXT NOT NULL) WITHOUT ROWID",
    // The properties of each level: the elements that carry each, by the
    // data type of their values; kept in step with the files.
    "CREATE TABLE IF NOT EXISTS level_properties(level INTEGER NOT NULL, name TEXT NOT NULL,"
    " occurrences INTEGER NOT NULL, integers INTEGER NOT NULL, numerics INTEGER NOT NULL, times INTEGER NOT NULL,"
    " strings INTEGER NOT NULL, PRIMARY KEY (level, name)) WITHOUT ROWID",
    "CREATE TABLE IF NOT EXISTS optimized_properties(level INTEGER NOT NULL, name TEXT NOT NULL,"
    " state INTEGER NOT NULL, PRIMARY KEY (level, name)) WITHOUT ROWID",
    "CREATE TABLE IF NOT EXISTS index_meta(name TEXT PRIMARY KEY, value TEXT NOT NULL) WITHOUT ROWID",
};

std::uint32_t Clamped(std::int64_t value)
{
    return std::uint32_t(std::clamp<std::int64_t>(value, 0, std::numeric_limits<std::uint32_t>::max() - 1));
}

[[noreturn]] void Refuse(const QString &text)
{
    ref::Fail(cv::rovo::status::StoreUnavailable, text.toStdU16String());
}

// Moves one file: a rename, or a copy and a removal between file systems.
void MoveFile(const QString &from, const QString &to)
{
    if (!QFile::exists(from))
        return;
    if (::rename(QFile::encodeName(from).constData(), QFile::encodeName(to).constData()) == 0)
        return;
    QFile::remove(to);
    if (!QFile::copy(from, to))
        Refuse(QStringLiteral("the index file %1 cannot be copied to %2").arg(from, to));
    QFile::remove(from);
}

} // namespace

QString IndexStatus::FileIn(const QString &indexFolder)
{
    return QDir(indexFolder).filePath(QStringLiteral("status.sqlite"));
}

IndexStatus::IndexStatus(const QString &indexFolder)
{
    m_changes = ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC);
    Open(indexFolder);
}

IndexStatus::~IndexStatus()
{
    if (m_changes >= 0)
        ::close(m_changes);
}

void IndexStatus::Open(const QString &indexFolder)
{
    if (!QDir().mkpath(indexFolder))
        Refuse(QStringLiteral("the index folder %1 cannot be created").arg(indexFolder));
    auto db = std::make_unique<rovo::Db>(FileIn(indexFolder), true, kBusyMilliseconds);
    db->Exec("PRAGMA journal_mode=WAL");
    db->Exec("PRAGMA synchronous=NORMAL");
    for (const char *sql : kSchema)
        db->Exec(sql);
    m_db = std::move(db);
    m_folder = QFileInfo(indexFolder).absoluteFilePath();
    m_elementCountsValid = false;
    Watch();
}

void IndexStatus::Watch()
{
    if (m_changes < 0)
        return;
    if (m_watch >= 0)
        ::inotify_rm_watch(m_changes, m_watch);
    m_watch = ::inotify_add_watch(m_changes, QFile::encodeName(m_folder).constData(),
                                  IN_MODIFY | IN_CREATE | IN_DELETE | IN_MOVED_TO | IN_MOVED_FROM);
}

QString IndexStatus::Folder() const
{
    std::lock_guard lock(m_lock);
    return m_folder;
}

// True when the status file or its write-ahead log was written since the
// last call, or when that cannot be told. Readers touch only the shared
// memory file, so the server's own queries do not count.
bool IndexStatus::FolderChanged()
{
    if (m_changes < 0 || m_watch < 0)
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
        rovo::Statement query(*m_db, "SELECT kind, count FROM element_counts");
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
    rovo::Statement query(*m_db, "SELECT value FROM counters WHERE name = ?1");
    query.Bind(1, QString::fromLatin1(name));
    return query.Step() ? query.Int(0) : 0;
}

void IndexStatus::SetCounter(const char *name, std::int64_t value)
{
    rovo::Statement update(*m_db, "INSERT INTO counters(name, value) VALUES(?1, ?2) "
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
    rovo::Statement query(*m_db, "SELECT total(count) FROM parselet_timeouts");
    return query.Step() ? Clamped(query.Int(0)) : 0;
}

IndexStatus::PerParselet IndexStatus::FileviewsTimeoutedPerParselet()
{
    std::lock_guard lock(m_lock);
    PerParselet result;
    rovo::Statement query(*m_db, "SELECT parselet, count FROM parselet_timeouts WHERE count > 0 ORDER BY parselet");
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
    rovo::Transaction transaction(*m_db, rovo::Transaction::Kind::Write, cv::rovo::status::StoreUnavailable);
    m_db->Exec("DELETE FROM files WHERE outcome = 1; DELETE FROM parselet_timeouts");
    transaction.Commit();
}

void IndexStatus::ResetFailure()
{
    std::lock_guard lock(m_lock);
    rovo::Transaction transaction(*m_db, rovo::Transaction::Kind::Write, cv::rovo::status::StoreUnavailable);
    m_db->Exec("DELETE FROM files WHERE outcome = 2");
    SetCounter("failures", 0);
    transaction.Commit();
}

void IndexStatus::ResetNotMyFile()
{
    std::lock_guard lock(m_lock);
    SetCounter("not_my_file", 0);
}

void IndexStatus::ResetIndex(bool configurationToo)
{
    std::lock_guard lock(m_lock);
    rovo::Transaction transaction(*m_db, rovo::Transaction::Kind::Write, cv::rovo::status::StoreUnavailable);
    m_db->Exec("DELETE FROM element_counts;"
               "DELETE FROM parselet_timeouts;"
               "DELETE FROM files;"
               "DELETE FROM level_properties;"
               "DELETE FROM index_meta;"
               "UPDATE counters SET value = 0 WHERE name IN ('disk_full_crawl_stop', 'failures', 'not_my_file')");
    if (configurationToo)
        m_db->Exec("DELETE FROM optimized_properties");
    transaction.Commit();
    ++m_epoch;
}

void IndexStatus::MoveTo(const QString &indexFolder)
{
    std::lock_guard lock(m_lock);
    const QString target = QFileInfo(indexFolder).absoluteFilePath();
    if (QDir::cleanPath(target) == QDir::cleanPath(m_folder))
        return;
    if (!QDir().mkpath(target))
        Refuse(QStringLiteral("the index folder %1 cannot be created").arg(target));
    const QString from = m_folder;
    const bool targetHasIndex = QFile::exists(FileIn(target));
    if (!targetHasIndex) {
        // Everything in the main file, so that it alone is the index.
        m_db->Exec("PRAGMA wal_checkpoint(TRUNCATE)");
    }
    m_db.reset();
    try {
        if (!targetHasIndex) {
            for (const char *suffix : kStatusSuffixes)
                MoveFile(FileIn(from) + QLatin1String(suffix), FileIn(target) + QLatin1String(suffix));
        }
        Open(target);
    } catch (const ref::Failure &) {
        Open(QFile::exists(FileIn(target)) ? target : from);
        throw;
    }
    if (targetHasIndex)
        ++m_epoch; // another index: what the indexer knew is not in it
    else
        QDir().rmdir(from); // only when nothing else is left in it
}

std::int64_t IndexStatus::AppliedRequest()
{
    std::lock_guard lock(m_lock);
    return Value("applied_request");
}

void IndexStatus::RecordApplied(std::int64_t generation, std::int64_t request)
{
    std::lock_guard lock(m_lock);
    rovo::Transaction transaction(*m_db, rovo::Transaction::Kind::Write, cv::rovo::status::StoreUnavailable);
    SetCounter("applied_generation", generation);
    SetCounter("applied_request", request);
    transaction.Commit();
}

} // namespace sorvik::server
