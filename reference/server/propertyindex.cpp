#include "reference/server/propertyindex.h"

#include "reference/libsupport/refobject.h"
#include "reference/server/indexrecords.h"
#include "sorvik/rovoapi.h"

namespace sorvik::server {

namespace {

using rovo::Statement;

constexpr std::uint32_t kInteger = 3, kNumeric = 10, kString = 23, kTime = 30;

} // namespace

std::optional<int> LevelOfKey(const QString &key)
{
    for (int level = 0; level < int(std::size(kPropertyLevels)); ++level) {
        if (key.compare(QLatin1String(kPropertyLevels[level].key), Qt::CaseInsensitive) == 0)
            return level;
    }
    return std::nullopt;
}

std::uint32_t StateOfType(int type)
{
    switch (type) {
    case 0:
        return kInteger;
    case 1:
        return kNumeric;
    case 2:
        return kTime;
    default:
        return kString;
    }
}

PropertyIndex::PropertyIndex(IndexStatus &status) : m_status(status)
{
    m_thread = std::thread([this] { Count(); });
}

PropertyIndex::~PropertyIndex()
{
    Stop();
}

void PropertyIndex::Stop()
{
    {
        std::lock_guard guard(m_lock);
        m_stopping = true;
    }
    m_wake.notify_all();
    if (m_thread.joinable())
        m_thread.join();
}

std::vector<LevelProperty> PropertyIndex::Properties(int level)
{
    return m_status.WithIndex([&](rovo::Db &db) {
        std::vector<LevelProperty> properties;
        Statement select(db, "SELECT name, occurrences FROM level_properties WHERE level = ?1 ORDER BY name");
        select.Bind(1, std::int64_t(level));
        while (select.Step())
            properties.push_back({select.Text(0), std::uint32_t(std::min<std::int64_t>(select.Int(1), UINT32_MAX))});
        return properties;
    });
}

void PropertyIndex::StartOccurrenceCount(int level)
{
    {
        std::lock_guard guard(m_lock);
        m_requested[level] = true;
        m_counting[level] = true;
    }
    m_wake.notify_all();
}

bool PropertyIndex::IsCounting(int level) const
{
    std::lock_guard guard(m_lock);
    return m_counting[level];
}

void PropertyIndex::Count()
{
    std::unique_lock guard(m_lock);
    for (;;) {
        m_wake.wait(guard, [this] { return m_stopping || m_requested[0] || m_requested[1] || m_requested[2]; });
        if (m_stopping)
            return;
        for (int level = 0; level < 3; ++level) {
            if (!m_requested[level])
                continue;
            m_requested[level] = false;
            guard.unlock();
            try {
                m_status.WithIndex([level](rovo::Db &db) {
                    rovo::Transaction transaction(db, rovo::Transaction::Kind::Write,
                                                  cv::rovo::status::StoreUnavailable);
                    SummarizeLevelProperties(db, level);
                    transaction.Commit();
                });
            } catch (const std::exception &) {
                // Nothing to report to: the count keeps what it had.
            } catch (const ref::Failure &) {
            }
            guard.lock();
            // A request made while this one ran is counted again.
            m_counting[level] = m_requested[level];
        }
    }
}

std::uint32_t PropertyIndex::OptimizationState(int level, const QString &name)
{
    return m_status.WithIndex([&](rovo::Db &db) {
        Statement select(db, "SELECT state FROM optimized_properties WHERE level = ?1 AND name = ?2");
        select.Bind(1, std::int64_t(level)).Bind(2, name);
        return select.Step() ? std::uint32_t(select.Int(0)) : cv::rovo::kNotOptimized;
    });
}

std::vector<std::pair<QString, std::uint32_t>> PropertyIndex::OptimizedProperties(int level)
{
    return m_status.WithIndex([&](rovo::Db &db) {
        std::vector<std::pair<QString, std::uint32_t>> optimized;
        Statement select(db, "SELECT name, state FROM optimized_properties WHERE level = ?1 ORDER BY name");
        select.Bind(1, std::int64_t(level));
        while (select.Step())
            optimized.emplace_back(select.Text(0), std::uint32_t(select.Int(1)));
        return optimized;
    });
}

void PropertyIndex::Optimize(int level, const QString &name, std::uint32_t state)
{
    m_status.WithIndex([&](rovo::Db &db) {
        std::uint32_t resolved = state;
        if (state == cv::rovo::kOptimizedDefault) {
            const std::string sql =
                std::string("SELECT ") + kLevelPropertyType + " FROM level_properties WHERE level = ?1 AND name = ?2";
            Statement type(db, sql.c_str());
            type.Bind(1, std::int64_t(level)).Bind(2, name);
            if (type.Step())
                resolved = StateOfType(int(type.Int(0)));
        }
        Statement write(db, "INSERT OR REPLACE INTO optimized_properties(level, name, state) VALUES (?1, ?2, ?3)");
        write.Bind(1, std::int64_t(level)).Bind(2, name).Bind(3, std::int64_t(resolved)).Run();
    });
}

void PropertyIndex::Unoptimize(int level, const QString &name)
{
    m_status.WithIndex([&](rovo::Db &db) {
        Statement remove(db, "DELETE FROM optimized_properties WHERE level = ?1 AND name = ?2");
        remove.Bind(1, std::int64_t(level)).Bind(2, name).Run();
    });
}

} // namespace sorvik::server
