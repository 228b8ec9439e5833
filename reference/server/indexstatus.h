#pragma once

#include "reference/libsupport/db.h"

#include <QString>

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>

namespace sorvik::server {

// The index of the server and what it knows about it, in one SQLite file,
// "status.sqlite" in the index folder: the files indexed with the
// properties of their elements (the indexer's tables, see indexrecords.h),
// the optimized properties, and the statistics the clients ask for:
// element counts per level, the crawl-stop flag, time-outs per Parselet and
// the failure counters. An administrator (or a test) can look at it and
// change it with the sqlite3 tool while the server runs.
//
// Thread-safe: the connections, the indexer and the property requests share
// one, each call holding its lock.
class IndexStatus
{
public:
    // Opens or creates the status file in indexFolder, creating the folder.
    // Raises ref::Failure when it cannot.
    explicit IndexStatus(const QString &indexFolder);
    ~IndexStatus();

    static QString FileIn(const QString &indexFolder);
    QString Folder() const;

    std::uint32_t ElementCount(std::uint32_t kind);
    bool DiskIsFullCrawlStop();
    std::uint32_t FileviewsTimeouted();
    struct PerParselet
    {
        std::uint32_t entries = 0;
        std::u16string text; // "name$count;" per Parselet, in name order
    };
    PerParselet FileviewsTimeoutedPerParselet();

    // The file resets forget the files concerned, so that the next indexing
    // reads them again, and clear what counted them.
    void ResetTimeouted();
    void ResetFailure();
    void ResetNotMyFile();
    // Forgets everything the index knew (a reset of the index); with
    // configurationToo also which properties are optimized.
    void ResetIndex(bool configurationToo = false);
    // Changes with every ResetIndex: what the indexer read before it is
    // not to be written after it.
    std::uint64_t Epoch() const { return m_epoch.load(); }

    // Moves the index to another folder: its files are moved there (renamed,
    // or copied and removed across file systems) and opened again. When the
    // folder already holds an index, that one is used and the old one left
    // where it is. Raises ref::Failure, the index staying where it was.
    void MoveTo(const QString &indexFolder);

    // What the server has taken up of its configuration, kept beside the
    // index so that a restarted server knows which requests it has done.
    std::int64_t AppliedRequest();
    void RecordApplied(std::int64_t generation, std::int64_t request);

    // Runs body(db) with the index locked, for the parts of the server that
    // keep their tables in the same file.
    template <typename Body>
    auto WithIndex(Body &&body)
    {
        std::lock_guard lock(m_lock);
        return body(*m_db);
    }

private:
    void Open(const QString &indexFolder);
    void Watch();
    bool FolderChanged();
    std::uint32_t Counter(const char *name);
    std::int64_t Value(const char *name);
    void SetCounter(const char *name, std::int64_t value);

    mutable std::mutex m_lock;
    QString m_folder;
    std::unique_ptr<rovo::Db> m_db;
    std::atomic<std::uint64_t> m_epoch{0};
    // Element counts are asked for far more often than they change: they are
    // kept in memory until a file of the index folder is written to.
    std::unordered_map<std::uint32_t, std::uint32_t> m_elementCounts;
    bool m_elementCountsValid = false;
    int m_changes = -1; // inotify on the index folder
    int m_watch = -1;
};

} // namespace sorvik::server
