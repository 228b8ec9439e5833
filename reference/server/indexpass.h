#pragma once

#include "reference/server/filereading.h"
#include "reference/server/indexplan.h"
#include "reference/server/indexrecords.h"

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <string>

namespace sorvik::server {

// How far the indexer has come, for GetIndexingProgress: done equals total
// unless a pass runs.
struct IndexProgress
{
    std::atomic<std::uint32_t> done{0};
    std::atomic<std::uint32_t> total{0};
    std::atomic<std::int64_t> lastMs{-1}; // ms since 1970 of the last step; -1 before the first
};

struct PassSummary
{
    bool completed = false; // false: stopped, or the index was reset meanwhile
    std::uint32_t files = 0;     // in the search areas, for a Parselet with a reader
    std::uint32_t read = 0;      // of them read, the others were unchanged
    std::uint32_t indexed = 0;   // of those read
    std::uint32_t timedOut = 0;
    std::uint32_t failed = 0;
    std::uint32_t removed = 0;   // left the index
    std::chrono::milliseconds took{0};
};

// One pass of the indexer: walks the search areas (without the excluded
// folders and without following symbolic links), reads every file whose
// Parselet has a reader and that is new, changed, read by another Parselet
// than before or asked to be read again, each within the time-out per file,
// and records the outcomes; files that are gone leave the index. Work is
// written in batches, so a pass that is stopped keeps what it did.
class IndexPass
{
public:
    struct Hooks
    {
        std::function<bool()> stopRequested;            // looked at between files
        ReadInterruption interruption;                  // ends a read that waits
        std::function<void(const std::string &)> walkedFolder; // each folder walked
    };

    IndexPass(IndexRecords &records, const IndexPlan &plan, std::chrono::milliseconds fileTimeout, Hooks hooks,
              IndexProgress &progress);

    PassSummary Run();

private:
    struct Candidate
    {
        std::string path;
        FileSignature signature;
        // Whether the walk looked at its size and time: only for files the
        // index knows; a new file is read anyway, and looked at then.
        bool stated = false;
    };

    bool Walk(std::vector<Candidate> &candidates);
    void WalkArea(const IndexPlan::Area &area, std::vector<Candidate> &candidates);
    FileOutcome Read(const Candidate &candidate, bool &stopped);
    bool Flush(std::vector<FileOutcome> &outcomes, const std::vector<std::string> &removed);

    IndexRecords &m_records;
    const IndexPlan &m_plan;
    const std::chrono::milliseconds m_fileTimeout;
    Hooks m_hooks;
    IndexProgress &m_progress;
    std::uint64_t m_epoch = 0;
    std::unordered_map<std::string, FileSignature> m_known; // as the pass began
    std::vector<char> m_buffer;
};

} // namespace sorvik::server
