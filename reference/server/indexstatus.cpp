#include "reference/server/indexstatus.h"

#include <QDir>

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
}

std::uint32_t IndexStatus::ElementCount(std::uint32_t kind)
{
    std::lock_guard lock(m_lock);
    rovo::Statement query(m_db, "SELECT count FROM element_counts WHERE kind = ?1");
    query.Bind(1, std::int64_t(kind));
    return query.Step() ? Clamped(query.Int(0)) : 0;
}

std::uint32_t IndexStatus::Counter(const char *name)
{
    rovo::Statement query(m_db, "SELECT value FROM counters WHERE name = ?1");
    query.Bind(1, QString::fromLatin1(name));
    return query.Step() ? Clamped(query.Int(0)) : 0;
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

} // namespace sorvik::server
