#pragma once

#include "reference/libsupport/db.h"

#include <QString>

#include <cstdint>
#include <mutex>
#include <string>
#include <unordered_map>

namespace sorvik::server {

// What the server knows about its index: element counts per level, the
// crawl-stop flag, time-outs per Parselet and the failure counters. Kept in
// "status.sqlite" in the index folder, so an administrator (or a test) can
// look at it and change it with the sqlite3 tool while the server runs.
//
// Thread-safe: every connection of the server shares one.
class IndexStatus
{
public:
    // Opens or creates the status file in indexFolder, creating the folder.
    // Raises ref::Failure when it cannot.
    explicit IndexStatus(const QString &indexFolder);
    ~IndexStatus();

    static QString FileIn(const QString &indexFolder);

    std::uint32_t ElementCount(std::uint32_t kind);
    bool DiskIsFullCrawlStop();
    std::uint32_t FileviewsTimeouted();
    struct PerParselet
    {
        std::uint32_t entries = 0;
        std::u16string text; // "name$count;" per Parselet, in name order
    };
    PerParselet FileviewsTimeoutedPerParselet();

    void ResetTimeouted();
    void ResetFailure();
    void ResetNotMyFile();
    // Forgets everything the index knew (a reset of the index).
    void ResetIndex();

    // What the server has taken up of its configuration, kept beside the
    // index so that a restarted server knows which requests it has done.
    std::int64_t AppliedRequest();
    void RecordApplied(std::int64_t generation, std::int64_t request);

private:
    bool FolderChanged();
    std::uint32_t Counter(const char *name);
    std::int64_t Value(const char *name);
    void SetCounter(const char *name, std::int64_t value);

    std::mutex m_lock;
    rovo::Db m_db;
    // Element counts are asked for far more often than they change: they are
    // kept in memory until a file of the index folder is written to.
    std::unordered_map<std::uint32_t, std::uint32_t> m_elementCounts;
    bool m_elementCountsValid = false;
    int m_changes = -1; // inotify on the index folder

};

} // namespace sorvik::server
