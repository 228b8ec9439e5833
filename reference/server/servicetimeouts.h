#pragma once

#include <atomic>
#include <cstdint>
#include <optional>

namespace sorvik::server {

// The two service time-outs the running server uses. The committed
// configuration sets them; the index manager's SetServiceTimeout changes
// them at once, and such a change stays until a commit changes the
// configured value again.
class ServiceTimeouts
{
public:
    static constexpr std::uint32_t kDefaultBrowseMs = 5000;
    static constexpr std::uint32_t kDefaultQueryMs = 20000;

    // Browse and connection: how long a client connection may take to
    // complete a request it has begun to send, or to take a response.
    std::uint32_t BrowseMs() const { return m_browseMs.load(std::memory_order_relaxed); }
    // Kept and reported; the reference server runs no queries.
    std::uint32_t QueryMs() const { return m_queryMs.load(std::memory_order_relaxed); }

    // kind 1 browse and connection, 2 query; false for another kind.
    bool Set(std::int32_t kind, std::uint32_t milliseconds)
    {
        if (kind != 1 && kind != 2)
            return false;
        (kind == 1 ? m_browseMs : m_queryMs).store(milliseconds, std::memory_order_relaxed);
        return true;
    }

    // The configured time-outs in seconds (0: not set, the default applies).
    // Only the thread that takes up commits calls this.
    void TakeUp(std::uint32_t browseSeconds, std::uint32_t querySeconds)
    {
        if (m_configuredBrowse != browseSeconds)
            m_browseMs.store(browseSeconds ? browseSeconds * 1000 : kDefaultBrowseMs, std::memory_order_relaxed);
        if (m_configuredQuery != querySeconds)
            m_queryMs.store(querySeconds ? querySeconds * 1000 : kDefaultQueryMs, std::memory_order_relaxed);
        m_configuredBrowse = browseSeconds;
        m_configuredQuery = querySeconds;
    }

private:
    std::atomic<std::uint32_t> m_browseMs{kDefaultBrowseMs};
    std::atomic<std::uint32_t> m_queryMs{kDefaultQueryMs};
    std::optional<std::uint32_t> m_configuredBrowse;
    std::optional<std::uint32_t> m_configuredQuery;
};

} // namespace sorvik::server
