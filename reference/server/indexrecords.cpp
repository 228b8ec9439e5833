#include "reference/server/indexrecords.h"

#include "sorvik/rovoapi.h"

#include <array>
#include <charconv>
#include <map>

namespace sorvik::server {

namespace {

using rovo::Statement;
namespace status = cv::rovo::status;

constexpr std::uint32_t kFiles = 8, kGroups = 16, kChannels = 32;

// How the elements carrying one property change: in all, and by data type.
struct PropertyDelta
{
    std::int64_t occurrences = 0;
    std::array<std::int64_t, 4> byType{};
};

// The statistics and the level summary a change of files moves, summed over
// one transaction.
struct Deltas
{
    std::int64_t files = 0;
    std::int64_t groups = 0;
    std::int64_t channels = 0;
    std::int64_t failures = 0;
    std::map<std::string, std::int64_t> timeouts; // per Parselet
    std::map<std::pair<int, std::string>, PropertyDelta> properties;

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

    void CountProperty(int level, const std::string &name, int type, int sign)
    {
        PropertyDelta &delta = properties[{level, name}];
        delta.occurrences += sign;
        delta.byType[std::size_t(type & 3)] += sign;
    }

    void CountProperties(const readers::TableContent &content, int sign)
    {
        for (const readers::Property &property : content.fileProperties)
            CountProperty(0, property.name, int(property.type), sign);
        for (const readers::Property &property : content.groupProperties)
            CountProperty(1, property.name, int(property.type), sign);
        for (const readers::Channel &channel : content.channels) {
            for (const readers::Property &property : channel.properties)
                CountProperty(2, property.name, int(property.type), sign);
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
        ApplyProperties(db);
    }

    void ApplyProperties(rovo::Db &db) const
    {
        Statement summary(db, "INSERT INTO level_properties(level, name, occurrences, integers, numerics, times, strings) "
                              "VALUES (?1, ?2, ?3, ?4, ?5, ?6, ?7) ON CONFLICT(level, name) DO UPDATE SET "
                              "occurrences = occurrences + ?3, integers = integers + ?4, numerics = numerics + ?5, "
                              "times = times + ?6, strings = strings + ?7");
        bool dropped = false;
        for (const auto &[key, delta] : properties) {
            if (delta.occurrences == 0 && delta.byType == std::array<std::int64_t, 4>{})
                continue;
            dropped = dropped || delta.occurrences < 0;
            summary.Bind(1, std::int64_t(key.first)).BindUtf8(2, key.second).Bind(3, delta.occurrences);
            for (std::size_t type = 0; type < 4; ++type)
                summary.Bind(int(4 + type), delta.byType[type]);
            summary.Run();
            summary.Reset();
        }
        if (dropped)
            db.Exec("DELETE FROM level_properties WHERE occurrences <= 0");
    }
};

// The statements one transaction of records uses, prepared once.
struct RecordStatements
{
    explicit RecordStatements(rovo::Db &db)
        : old(db, "SELECT outcome, parselet, channels, properties FROM files WHERE path = ?1"),
          oldProperties(db, "SELECT json_extract(value, '$[0]'), json_extract(value, '$[2]'), "
                            "json_extract(value, '$[4]') FROM json_each(?1)"),
          drop(db, "DELETE FROM files WHERE path = ?1"),
          write(db, "INSERT OR REPLACE INTO files(path, size, mtime, parselet, outcome, channels, detail, properties) "
                    "VALUES (?1, ?2, ?3, ?4, ?5, ?6, ?7, ?8)")
    {
    }

    // Takes what the index held of the file out of the statistics; false
    // when it held nothing.
    bool Forget(const std::string &path, Deltas &deltas)
    {
        old.BindUtf8(1, path);
        if (!old.Step()) {
            old.Reset();
            return false;
        }
        deltas.Count(int(old.Int(0)), old.Utf8(1), old.Int(2), -1);
        const std::string properties = old.Utf8(3);
        old.Reset();
        oldProperties.BindUtf8(1, properties);
        while (oldProperties.Step())
            deltas.CountProperty(int(oldProperties.Int(0)), oldProperties.Utf8(1), int(oldProperties.Int(2)), -1);
        oldProperties.Reset();
        return true;
    }

    void Remove(const std::string &path, Deltas &deltas)
    {
        if (!Forget(path, deltas))
            return;
        drop.BindUtf8(1, path).Run();
        drop.Reset();
    }

    void Write(const FileOutcome &outcome, Deltas &deltas)
    {
        if (outcome.known)
            Forget(outcome.path, deltas);
        const bool indexed = outcome.kind == FileOutcomeKind::Indexed;
        const std::int64_t channels = indexed ? std::int64_t(outcome.content.channels.size()) : 0;
        const std::string properties = indexed ? PropertiesJson(outcome.content) : std::string("[]");
        write.BindUtf8(1, outcome.path)
            .Bind(2, outcome.signature.size)
            .Bind(3, outcome.signature.mtime)
            .BindUtf8(4, outcome.signature.parselet)
            .Bind(5, std::int64_t(outcome.kind))
            .Bind(6, channels)
            .BindUtf8(7, outcome.detail)
            .BindUtf8(8, properties);
        write.Run();
        write.Reset();
        deltas.Count(int(outcome.kind), outcome.signature.parselet, channels, +1);
        if (indexed)
            deltas.CountProperties(outcome.content, +1);
    }

    Statement old, oldProperties, drop, write;
};

void AppendJsonString(std::string &json, std::string_view text)
{
    json.push_back('"');
    for (const char c : text) {
        switch (c) {
        case '"':
            json += "\\\"";
            break;
        case '\\':
            json += "\\\\";
            break;
        default:
            if (static_cast<unsigned char>(c) < 0x20) {
                static constexpr char kHex[] = "0123456789abcdef";
                json += "\\u00";
                json.push_back(kHex[(c >> 4) & 0xF]);
                json.push_back(kHex[c & 0xF]);
            } else {
                json.push_back(c);
            }
        }
    }
    json.push_back('"');
}

void AppendNumber(std::string &json, std::size_t number)
{
    char digits[24];
    const auto [end, error] = std::to_chars(digits, digits + sizeof digits, number);
    json.append(digits, end);
}

void AppendProperties(std::string &json, int level, std::size_t element, const std::vector<readers::Property> &properties)
{
    for (const readers::Property &property : properties) {
        json += json.size() > 1 ? ",[" : "[";
        json.push_back(char('0' + level));
        json.push_back(',');
        AppendNumber(json, element);
        json.push_back(',');
        AppendJsonString(json, property.name);
        json.push_back(',');
        AppendJsonString(json, property.value);
        json.push_back(',');
        json.push_back(char('0' + int(property.type)));
        json.push_back(']');
    }
}

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

std::string PropertiesJson(const readers::TableContent &content)
{
    std::string json;
    json.reserve(256);
    json.push_back('[');
    AppendProperties(json, 0, 0, content.fileProperties);
    AppendProperties(json, 1, 0, content.groupProperties);
    for (std::size_t channel = 0; channel < content.channels.size(); ++channel)
        AppendProperties(json, 2, channel, content.channels[channel].properties);
    json.push_back(']');
    return json;
}

void SummarizeLevelProperties(rovo::Db &db, int level)
{
    Statement clear(db, "DELETE FROM level_properties WHERE ?1 < 0 OR level = ?1");
    clear.Bind(1, std::int64_t(level)).Run();
    Statement fill(db, "INSERT INTO level_properties(level, name, occurrences, integers, numerics, times, strings) "
                       "SELECT level, name, count(*), sum(type = 0), sum(type = 1), sum(type = 2), sum(type = 3) FROM "
                       "(SELECT json_extract(p.value, '$[0]') AS level, json_extract(p.value, '$[2]') AS name, "
                       "json_extract(p.value, '$[4]') AS type FROM files f, json_each(f.properties) p "
                       "WHERE f.outcome = 0) WHERE ?1 < 0 OR level = ?1 GROUP BY level, name");
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
            statements.Remove(path, deltas);
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
        // Optimized "with the server's default data type" before the
        // property was in the index: it gets the type now found.
        const std::string resolve =
            std::string("UPDATE optimized_properties SET state = (SELECT CASE ") + kLevelPropertyType +
            " WHEN 0 THEN 3 WHEN 1 THEN 10 WHEN 2 THEN 30 ELSE 23 END FROM level_properties l "
            "WHERE l.level = optimized_properties.level AND l.name = optimized_properties.name) "
            "WHERE state = 0 AND EXISTS (SELECT 1 FROM level_properties l "
            "WHERE l.level = optimized_properties.level AND l.name = optimized_properties.name)";
        db.Exec(resolve.c_str());
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
