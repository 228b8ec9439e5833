#include "reference/server/indexpass.h"


#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>


namespace sorvik::server {

namespace {

using Clock = std::chrono::steady_clock;

// A batch is written when it is this large or this old.
constexpr std::size_t kBatchFiles = 2048;
constexpr auto kBatchAge = std::chrono::milliseconds(500);

std::int64_t NowMs()
{
    return std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::system_clock::now().time_since_epoch())
        .count();
}

std::int64_t ModifiedNs(const struct stat &info)
{
    return std::int64_t(info.st_mtim.tv_sec) * 1000000000 + info.st_mtim.tv_nsec;
}

class Directory
{
public:
    explicit Directory(const std::string &path) : m_dir(::opendir(path.c_str())) {}
    ~Directory()
    {
        if (m_dir)
            ::closedir(m_dir);
    }
    Directory(const Directory &) = delete;
    Directory &operator=(const Directory &) = delete;

    explicit operator bool() const { return m_dir != nullptr; }
    dirent *Next() { return ::readdir(m_dir); }
    int Fd() const { return ::dirfd(m_dir); }

private:
    DIR *m_dir;
};

} // namespace

IndexPass::IndexPass(IndexRecords &records, const IndexPlan &plan, std::chrono::milliseconds fileTimeout, Hooks hooks,
                     IndexProgress &progress)
    : m_records(records), m_plan(plan), m_fileTimeout(fileTimeout), m_hooks(std::move(hooks)), m_progress(progress)
{
}

PassSummary IndexPass::Run()
{
    const auto started = Clock::now();
    PassSummary summary;
    // The counters differ from the start of the pass to its end.
    m_progress.total.store(m_progress.done.load() + 1);
    m_progress.lastMs.store(NowMs());

    m_known = m_records.Snapshot(m_epoch);
    std::unordered_map<std::string, FileSignature> &known = m_known;
    std::vector<Candidate> candidates;
    if (!Walk(candidates))
        return summary;
    summary.files = std::uint32_t(candidates.size());
    m_progress.done.store(0);
    m_progress.total.store(std::uint32_t(candidates.size()) + 1);

    std::vector<FileOutcome> outcomes;
    auto flushed = Clock::now();
    for (const Candidate &candidate : candidates) {
        if (m_hooks.stopRequested && m_hooks.stopRequested())
            return summary;
        const auto found = known.find(candidate.path);
        const bool knew = found != known.end();
        const bool current = knew && candidate.stated && found->second == candidate.signature;
        if (knew)
            known.erase(found);
        if (!current) {
            bool stopped = false;
            FileOutcome outcome = Read(candidate, stopped);
            outcome.known = knew;
            if (stopped)
                return summary;
            ++summary.read;
            ++(outcome.kind == FileOutcomeKind::Indexed    ? summary.indexed
               : outcome.kind == FileOutcomeKind::TimedOut ? summary.timedOut
                                                           : summary.failed);
            outcomes.push_back(std::move(outcome));
        }
        m_progress.done.fetch_add(1);
        m_progress.lastMs.store(NowMs());
        if (outcomes.size() >= kBatchFiles || (!outcomes.empty() && Clock::now() - flushed >= kBatchAge)) {
            if (!Flush(outcomes, {}))
                return summary;
            flushed = Clock::now();
        }
    }
    // What the walk did not find has gone from the search areas.
    std::vector<std::string> removed;
    removed.reserve(known.size());
    for (const auto &[path, signature] : known)
        removed.push_back(path);
    summary.removed = std::uint32_t(removed.size());
    if (!Flush(outcomes, removed))
        return summary;
    if (!m_records.Complete(m_epoch, m_plan.Fingerprint(), NowMs()))
        return summary;
    summary.completed = true;
    summary.took = std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - started);
    m_progress.total.store(m_progress.done.load());
    m_progress.lastMs.store(NowMs());
    return summary;
}

bool IndexPass::Walk(std::vector<Candidate> &candidates)
{
    for (const IndexPlan::Area &area : m_plan.areas) {
        if (m_hooks.stopRequested && m_hooks.stopRequested())
            return false;
        WalkArea(area, candidates);
    }
    return true;
}

void IndexPass::WalkArea(const IndexPlan::Area &area, std::vector<Candidate> &candidates)
{
    std::vector<std::string> folders{area.path};
    while (!folders.empty()) {
        const std::string folder = std::move(folders.back());
        folders.pop_back();
        Directory directory(folder);
        if (!directory)
            continue; // gone, or not readable: its files are not in the index
        if (m_hooks.walkedFolder)
            m_hooks.walkedFolder(folder);
        const std::string prefix = folder.empty() || folder.back() == '/' ? folder : folder + '/';
        while (dirent *entry = directory.Next()) {
            const std::string_view name = entry->d_name;
            if (name == "." || name == "..")
                continue;
            unsigned char type = entry->d_type;
            struct stat info;
            bool stated = false;
            if (type == DT_UNKNOWN) {
                if (::fstatat(directory.Fd(), entry->d_name, &info, AT_SYMLINK_NOFOLLOW) != 0)
                    continue;
                stated = true;
                type = S_ISDIR(info.st_mode)    ? DT_DIR
                       : S_ISREG(info.st_mode)  ? DT_REG
                       : S_ISFIFO(info.st_mode) ? DT_FIFO
                       : S_ISCHR(info.st_mode)  ? DT_CHR
                                                : DT_LNK;
            }
            if (type == DT_DIR) {
                std::string path = prefix + std::string(name);
                if (!IndexPlan::IsExcluded(area, path))
                    folders.push_back(std::move(path));
                continue;
            }
            if (type != DT_REG && type != DT_FIFO && type != DT_CHR)
                continue;
            const std::string *parselet = m_plan.ParseletFor(name);
            if (!parselet || !readers::HasReader(*parselet))
                continue;
            Candidate candidate{prefix + std::string(name), {0, 0, *parselet}, false};
            if (m_known.count(candidate.path)) {
                if (!stated && ::fstatat(directory.Fd(), entry->d_name, &info, AT_SYMLINK_NOFOLLOW) != 0)
                    continue;
                candidate.signature.size = std::int64_t(info.st_size);
                candidate.signature.mtime = ModifiedNs(info);
                candidate.stated = true;
            }
            candidates.push_back(std::move(candidate));
        }
    }
}

FileOutcome IndexPass::Read(const Candidate &candidate, bool &stopped)
{
    FileOutcome outcome;
    outcome.path = candidate.path;
    outcome.signature = candidate.signature;
    auto reader = readers::MakeReader(candidate.signature.parselet);
    try {
        const ReadResult result =
            ReadWithDeadline(candidate.path, Clock::now() + m_fileTimeout, m_hooks.interruption, m_buffer,
                             [&reader](std::string_view bytes) { reader->Feed(bytes); });
        if (result.size >= 0) {
            outcome.signature.size = result.size;
            outcome.signature.mtime = result.modifiedNs;
        } else if (!candidate.stated) {
            outcome.signature.mtime = -1; // not opened, so not looked at: tried again next time
        }
        switch (result.outcome) {
        case ReadOutcome::Complete:
            outcome.content = reader->Finish();
            outcome.kind = FileOutcomeKind::Indexed;
            break;
        case ReadOutcome::TimedOut:
            outcome.kind = FileOutcomeKind::TimedOut;
            break;
        case ReadOutcome::Unreadable:
            outcome.kind = FileOutcomeKind::Failed;
            outcome.detail = result.why;
            break;
        case ReadOutcome::Stopped:
            stopped = true;
            break;
        }
    } catch (const readers::ReadError &error) {
        outcome.kind = FileOutcomeKind::Failed;
        outcome.detail = error.text;
    } catch (const std::bad_alloc &) {
        outcome.kind = FileOutcomeKind::Failed;
        outcome.detail = "the file needs more memory than there is";
    }
    return outcome;
}

bool IndexPass::Flush(std::vector<FileOutcome> &outcomes, const std::vector<std::string> &removed)
{
    const bool written = m_records.Record(m_epoch, outcomes, removed);
    outcomes.clear();
    return written;
}

} // namespace sorvik::server
