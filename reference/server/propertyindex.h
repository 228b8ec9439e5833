#pragma once

#include "reference/server/indexstatus.h"

#include <QString>

#include <condition_variable>
#include <cstdint>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

namespace sorvik::server {

// The property levels: the name the property model describes them by, the
// key the index manager's operations take, and the display name in English.
struct PropertyLevel
{
    const char *name;
    const char *key;
    const char *displayName;
};
inline constexpr PropertyLevel kPropertyLevels[] = {
    {"file", "sorvik_root", "File"},
    {"qdm_channelgroup", "qdm_channelgroup", "Channel Group"},
    {"qdm_channel", "qdm_channel", "Channel"},
};

// Property levels by their keys: "sorvik_root" (files) 0,
// "qdm_channelgroup" 1, "qdm_channel" 2; case ignored. Nothing for any other.
std::optional<int> LevelOfKey(const QString &key);

struct LevelProperty
{
    QString name;
    std::uint32_t occurrences = 0; // elements of the level that carry it
};

// The property side of the index: which custom properties each level has
// and how often they occur, which of them are optimized, and occurrence
// counts on request, made on a thread of its own.
class PropertyIndex
{
public:
    explicit PropertyIndex(IndexStatus &status);
    ~PropertyIndex();

    PropertyIndex(const PropertyIndex &) = delete;
    PropertyIndex &operator=(const PropertyIndex &) = delete;

    // As of the last indexing or occurrence count, by name.
    std::vector<LevelProperty> Properties(int level);

    // Counts the occurrences of the level's properties anew, from the
    // properties of every element in the index, on the counting thread.
    void StartOccurrenceCount(int level);
    bool IsCounting(int level) const;

    // 101 (not optimized) for a property that is not optimized.
    std::uint32_t OptimizationState(int level, const QString &name);
    // The optimized properties of a level with their states, by name, also
    // those no longer in the index.
    std::vector<std::pair<QString, std::uint32_t>> OptimizedProperties(int level);
    // state 0 (the server's default data type) becomes the property's data
    // type as the index knows it (3 integer, 10 numeric, 23 string, 30 time),
    // or stays 0 until the property is indexed.
    void Optimize(int level, const QString &name, std::uint32_t state);
    void Unoptimize(int level, const QString &name);

    // Ends the counting thread.
    void Stop();

private:
    void Count();

    IndexStatus &m_status;
    mutable std::mutex m_lock;
    std::condition_variable m_wake;
    bool m_stopping = false;
    bool m_requested[3] = {false, false, false}; // asked for, not yet begun
    bool m_counting[3] = {false, false, false};  // asked for or running
    std::thread m_thread;
};

// The optimization state that stands for a data type of the index
// (0 integer, 1 numeric, 2 time, 3 string).
std::uint32_t StateOfType(int type);

} // namespace sorvik::server
