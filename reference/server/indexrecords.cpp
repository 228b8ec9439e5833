#include "reference/server/indexrecords.h"

#include "sorvik/rovoapi.h"

#include <map>

namespace sorvik::server {

namespace {

using rovo::Statement;
namespace status = cv::rovo::status;

constexpr std::uint32_t kFiles = 8, kGroups = 16, kChannels = 32;

// The statistics a change of files moves, summed over one transaction.
struct Deltas
{
    std::int64_t files = 0;
    std::int64_t groups = 0;
    std::int64_t channels = 0;
    std::int64_t failures = 0;
    std::map<std::string, std::int64_t> timeouts; // per Parselet

    void Count(int outcome, const std::string &parselet, std::int64_t channelCount, int sign)
    {
        switch (FileOutcomeKind(outcome)) {
        case FileOutcomeKind::Indexed:
            files += sign;
            groups += sign;
            channels += sign * channelCount;
            break;
        case FileOutcomeKind::TimedOut:
            timeouts[parselet] += sign;
            break;
        case FileOutcomeKind::Failed:
            failures += sign;
            break;
        }
    }

    void Apply(rovo::Db &db) const
    {
        Statement count(db, "INSERT INTO element_counts(kind, count) VALUES (?1, max(0, ?2)) "
                            "ON CONFLICT(kind) DO UPDATE SET count = max(0, count + ?2)");
        const std::pair<std::uint32_t, std::int64_t> levels[] = {{kFiles, files}, {kGroups, groups}, {kChannels, channels}};
        for (const auto &[kind, delta] : levels) {
            if (delta == 0)
                continue;
            count.Bind(1, std::int64_t(kind)).Bind(2, delta).Run();
            count.Reset();
        }
        if (failures != 0) {
            Statement failed(db, "INSERT INTO counters(name, value) VALUES ('failures', max(0, ?1)) "
                                 "ON CONFLICT(name) DO UPDATE SET value = max(0, value + ?1)");
            failed.Bind(1, failures).Run();
        }
        Statement timedOut(db, "INSERT INTO parselet_timeouts(parselet, count) VALUES (?1, max(0, ?2)) "
                               "ON CONFLICT(parselet) DO UPDATE SET count = max(0, count + ?2)");
        for (const auto &[parselet, delta] : timeouts) {
            if (delta == 0)
                continue;
            timedOut.BindUtf8(1, parselet).Bind(2, delta).Run();
            timedOut.Reset();
        }
        if (!timeouts.empty())
            db.Exec("DELETE FROM parselet_timeouts WHERE count <= 0");
    }
};

// The statements one transaction of records uses, prepared once.
struct RecordStatements
{
    explicit RecordStatements(rovo::Db &db)
        : old(db, "SELECT id, outcome, parselet, channels FROM files WHERE path = ?1"),
          dropProperties(db, "DELETE FROM properties WHERE file_id = ?1"),
          dropFile(db, "DELETE FROM files WHERE id = ?1"),
          upsert(db, "INSERT INTO files(path, size, mtime, parselet, outcome, channels, detail) "
                     "VALUES (?1, ?2, ?3, ?4, ?5, ?6, ?7) ON CONFLICT(path) DO UPDATE SET size = excluded.size, "
                     "mtime = excluded.mtime, parselet = excluded.parselet, outcome = excluded.outcome, "
                     "channels = excluded.channels, detail = excluded.detail RETURNING id"),
          property(db, "INSERT OR REPLACE INTO properties(file_id, level, element, name, value, type) "
                       "VALUES (?1, ?2, ?3, ?4, ?5, ?6)")
    {
    }

    // Forgets what the index held of the file; false when it held nothing.
    bool Forget(const std::string &path, Deltas &deltas, bool dropRow)
    {
        old.BindUtf8(1, path);
        const bool known = old.Step();
        if (known) {
            const std::int64_t id = old.Int(0);
            deltas.Count(int(old.Int(1)), old.Utf8(2), old.Int(3), -1);
            old.Reset();
            dropProperties.Bind(1, id).Run();
            dropProperties.Reset();
            if (dropRow) {
                dropFile.Bind(1, id).Run();
                dropFile.Reset();
            }
        } else {
            old.Reset();
        }
        return known;
    }

    void Write(const FileOutcome &outcome, Deltas &deltas)
    {
        Forget(outcome.path, deltas, false);
        const std::int64_t channels = std::int64_t(outcome.content.channels.size());
        upsert.BindUtf8(1, outcome.path)
            .Bind(2, outcome.signature.size)
            .Bind(3, outcome.signature.mtime)
            .BindUtf8(4, outcome.signature.parselet)
            .Bind(5, std::int64_t(outcome.kind))
            .Bind(6, outcome.kind == FileOutcomeKind::Indexed ? channels : 0)
            .BindUtf8(7, outcome.detail);
        upsert.Step();
        const std::int64_t id = upsert.Int(0);
        upsert.Reset();
        deltas.Count(int(outcome.kind), outcome.signature.parselet, channels, +1);
        if (outcome.kind != FileOutcomeKind::Indexed)
            return;
        const readers::TableContent &content = outcome.content;
        WriteProperties(id, 0, 0, content.fileProperties);
        WriteProperties(id, 1, 0, content.groupProperties);
        for (std::size_t channel = 0; channel < content.channels.size(); ++channel)
            WriteProperties(id, 2, std::int64_t(channel), content.channels[channel].properties);
    }

    void WriteProperties(std::int64_t id, int level, std::int64_t element, const std::vector<readers::Property> &properties)
    {
        for (const readers::Property &p : properties) {
            property.Bind(1, id).Bind(2, level).Bind(3, element).BindUtf8(4, p.name).BindUtf8(5, p.value).Bind(
                6, std::int64_t(p.type));
            property.Run();
            property.Reset();
        }
    }

    Statement old, dropProperties, dropFile, upsert, property;
};

void SetMeta(rovo::Db &db, const char *name, const std::string &value)
{
    Statement write(db, "INSERT OR REPLACE INTO index_meta(name, value) VALUES (?1, ?2)");
    write.Bind(1, QString::fromLatin1(name)).BindUtf8(2, value).Run();
}

std::optional<std::string> Meta(rovo::Db &db, const char *name)
{
    Statement read(db, "SELECT value FROM index_meta WHERE name = ?1");
    read.Bind(1, QString::fromLatin1(name));
    if (!read.Step())
        return std::nullopt;
    return read.Utf8(0);
}

} // namespace

void SummarizeLevelProperties(rovo::Db &db, int level)
{
    // A property's type is that of all its values: integers and numbers
    // together are numeric, any other mixture a string.
    const char *const summary =
        "INSERT INTO level_properties(level, name, occurrences, type) "
        "SELECT level, name, count(*), CASE WHEN min(type) = max(type) THEN min(type) "
        "WHEN max(type) = 1 THEN 1 ELSE 3 END FROM properties WHERE ?1 < 0 OR level = ?1 GROUP BY level, name";
    Statement clear(db, "DELETE FROM level_properties WHERE ?1 < 0 OR level = ?1");
    clear.Bind(1, std::int64_t(level)).Run();
    Statement fill(db, summary);
    fill.Bind(1, std::int64_t(level)).Run();
}

std::unordered_map<std::string, FileSignature> IndexRecords::Snapshot(std::uint64_t &epoch)
{
    return m_status.WithIndex([&](rovo::Db &db) {
        epoch = m_status.Epoch();
        std::unordered_map<std::string, FileSignature> files;
        Statement select(db, "SELECT path, size, mtime, parselet FROM files");
        while (select.Step())
            files.emplace(select.Utf8(0), FileSignature{select.Int(1), select.Int(2), select.Utf8(3)});
        return files;
    });
}

bool IndexRecords::Record(std::uint64_t epoch, const std::vector<FileOutcome> &outcomes,
                          const std::vector<std::string> &removed)
{
    return m_status.WithIndex([&](rovo::Db &db) {
        if (m_status.Epoch() != epoch)
            return false;
        rovo::Transaction transaction(db, rovo::Transaction::Kind::Write, status::StoreUnavailable);
        Deltas deltas;
        RecordStatements statements(db);
        for (const FileOutcome &outcome : outcomes)
            statements.Write(outcome, deltas);
        for (const std::string &path : removed)
            statements.Forget(path, deltas, true);
        deltas.Apply(db);
        transaction.Commit();
        return true;
    });
}

bool IndexRecords::Complete(std::uint64_t epoch, const std::string &planFingerprint, std::int64_t endedMs)
{
    return m_status.WithIndex([&](rovo::Db &db) {
        if (m_status.Epoch() != epoch)
            return false;
        rovo::Transaction transaction(db, rovo::Transaction::Kind::Write, status::StoreUnavailable);
        SummarizeLevelProperties(db, -1);
        // Optimized "with the server's default data type" before the
        // property was in the index: it gets the type now found.
        db.Exec("UPDATE optimized_properties SET state = (SELECT CASE type WHEN 0 THEN 3 WHEN 1 THEN 10 "
                "WHEN 2 THEN 30 ELSE 23 END FROM level_properties l WHERE l.level = optimized_properties.level "
                "AND l.name = optimized_properties.name) WHERE state = 0 AND EXISTS (SELECT 1 FROM "
                "level_properties l WHERE l.level = optimized_properties.level AND l.name = optimized_properties.name)");
        SetMeta(db, "plan", planFingerprint);
        SetMeta(db, "ended_ms", std::to_string(endedMs));
        transaction.Commit();
        return true;
    });
}

std::optional<IndexRecords::LastPass> IndexRecords::Last()
{
    return m_status.WithIndex([&](rovo::Db &db) -> std::optional<LastPass> {
        const auto plan = Meta(db, "plan");
        const auto ended = Meta(db, "ended_ms");
        if (!plan || !ended)
            return std::nullopt;
        return LastPass{*plan, std::atoll(ended->c_str())};
    });
}

void IndexRecords::MarkForReading(const QString &parselet)
{
    m_status.WithIndex([&](rovo::Db &db) {
        Statement mark(db, "UPDATE files SET mtime = -1 WHERE parselet = ?1 COLLATE NOCASE");
        mark.Bind(1, parselet).Run();
    });
}

} // namespace sorvik::server
