#pragma once

#include "reference/readers/tablereader.h"
#include "reference/server/indexstatus.h"

#include <QString>

#include <cstdint>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

namespace sorvik::server {

// What the index remembers of a file, to tell whether it must be read again.
struct FileSignature
{
    std::int64_t size = 0;
    std::int64_t mtime = 0; // nanoseconds since 1970; -1: read it again
    std::string parselet;

    bool operator==(const FileSignature &) const = default;
};

enum class FileOutcomeKind
{
    Indexed = 0,
    TimedOut = 1,
    Failed = 2,
};

struct FileOutcome
{
    std::string path; // local bytes
    FileSignature signature;
    // Whether the index knew the file when the pass began. Only resets
    // remove files meanwhile, so a file it did not know has nothing to
    // take back.
    bool known = true;
    FileOutcomeKind kind = FileOutcomeKind::Indexed;
    std::string detail; // why it failed
    readers::TableContent content;
};

// The indexer's tables in the index (the files with the properties of their
// elements, the level property summary) and the statistics that go with
// them: every write keeps the level property summary, the element counts
// (8 files, 16 channel groups, 32 channels), the time-outs per Parselet and
// the failure count in step with the files, in the same transaction.
class IndexRecords
{
public:
    explicit IndexRecords(IndexStatus &status) : m_status(status) {}

    // The signature of every file in the index, and the epoch it belongs to.
    std::unordered_map<std::string, FileSignature> Snapshot(std::uint64_t &epoch);

    // Writes the outcomes and forgets the removed files in one transaction;
    // false, with nothing written, when the index was reset after epoch.
    bool Record(std::uint64_t epoch, const std::vector<FileOutcome> &outcomes,
                const std::vector<std::string> &removed);

    // After a completed pass: the plan it followed and when it ended;
    // optimized properties that waited for their data type get it. False
    // when the index was reset after epoch.
    bool Complete(std::uint64_t epoch, const std::string &planFingerprint, std::int64_t endedMs);

    // The last completed pass, if any: its plan and when it ended.
    struct LastPass
    {
        std::string planFingerprint;
        std::int64_t endedMs = 0;
    };
    std::optional<LastPass> Last();

    // Every file read by the Parselet is read again by the next pass.
    void MarkForReading(const QString &parselet);

private:
    IndexStatus &m_status;
};

// Counts the level property summary of one level (0 file, 1 channel group,
// 2 channel), or of all with -1, anew from the properties of the files.
// With the index locked.
void SummarizeLevelProperties(rovo::Db &db, int level);

// The data type (0 integer, 1 numeric, 2 time, 3 string) of a row of
// level_properties, in SQL: integers and numbers together are numeric, any
// other mixture a string.
inline constexpr const char *kLevelPropertyType =
    "CASE WHEN strings > 0 OR (times > 0 AND integers + numerics > 0) THEN 3 WHEN times > 0 THEN 2 "
    "WHEN numerics > 0 THEN 1 ELSE 0 END";

// The properties of a file's elements as the index keeps them: a JSON
// array of [level, element, name, value, type].
std::string PropertiesJson(const readers::TableContent &content);

} // namespace sorvik::server
