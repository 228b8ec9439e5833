#pragma once

#include "reference/rovoapi/config.h"
#include "reference/rovoapi/store.h"

#include <QString>

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <set>
#include <span>
#include <thread>
#include <vector>

namespace sorvik::server {

// A configuration as committed to the store, with what it asks the server to do.
struct CommittedConfiguration
{
    std::int64_t generation = 0;
    rovo::Configuration configuration;
    std::vector<rovo::StoreRequest> requests; // not taken up yet, oldest first
};

// Takes up every configuration committed to the store of this instance, in
// this process. Woken by the commit itself (inotify on the commit marker
// that every committer writes once its commit is through, see
// rovo::AnnounceCommit) or by a waiter asking for a generation it has not
// taken up (Poke), it reads the committed configuration in one read
// transaction, spends the apply delay, hands it to the server and records
// its generation as applied. Commits made during the delay are taken up
// together afterwards.
//
// Waiters (the index manager's WaitForUpdate) learn of each applied
// generation at once.
class ConfigApplier
{
public:
    using TakeUp = std::function<void(const CommittedConfiguration &)>;

    // Opens the store, creating it when missing, and watches it. Raises
    // ref::Failure for the store and std::runtime_error when it cannot watch.
    ConfigApplier(const QString &storeFile, std::chrono::milliseconds applyDelay);
    ~ConfigApplier();

    ConfigApplier(const ConfigApplier &) = delete;
    ConfigApplier &operator=(const ConfigApplier &) = delete;

    // The committed settings, before Start.
    rovo::Settings CommittedSettings();

    // Takes up the configuration committed now, with the requests after
    // lastRequest, without delay (what was committed while no server ran),
    // then follows every later commit on a thread of its own until Stop.
    // The first take-up runs on the caller's thread and may raise.
    void Start(std::int64_t lastRequest, TakeUp takeUp);
    void Stop();

    // Makes the applier look at the store now: for a commit whose marker
    // was never written (its process died first, or the folder refuses it).
    void Poke();

    enum class Wait
    {
        Applied,
        Failed,    // the generation was reached, but taking it up failed
        Cancelled, // a descriptor of cancel became readable or hung up
    };
    // Blocks until the generation (or a later one) has been taken up.
    Wait WaitUntilApplied(std::int64_t generation, std::span<const int> cancel);

    std::int64_t Applied() const;
    // Why the last take-up failed; empty when it succeeded.
    QString Failure() const;
    std::size_t Waiting() const;
    std::chrono::milliseconds ApplyDelay() const { return m_applyDelay; }

private:
    void Run();
    bool CommitSeen();
    void TakeUpPending();
    CommittedConfiguration ReadCommitted();
    bool SpendApplyDelay();
    void Publish(std::int64_t generation, QString failure);

    const QString m_storeFile;
    const std::chrono::milliseconds m_applyDelay;
    std::unique_ptr<rovo::Db> m_db; // the applier's thread only, after Start
    int m_watch = -1;               // inotify on the store's folder
    int m_poke = -1;                // eventfd, readable after Poke
    int m_stop = -1;                // eventfd, readable once stopping
    TakeUp m_takeUp;
    std::int64_t m_lastRequest = 0;
    std::thread m_thread;

    mutable std::mutex m_lock;
    std::int64_t m_applied = -1;
    QString m_failure;
    std::set<int> m_waiters; // an eventfd per waiter, written on every publish
};

} // namespace sorvik::server
