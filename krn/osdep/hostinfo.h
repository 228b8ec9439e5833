#pragma once

#include "krn/osdep/ihostnetwork.h"

#include <chrono>
#include <deque>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace cv::krn::osdep {

class IniFile;

// Tells whether a host name or address text means this machine.
//
// Names found local are remembered for good; names found not local are
// remembered too, the last 50 of them. A name is local when it resolves to a
// loopback address (127.x.x.x or ::1) or to an address of one of this
// machine's Ethernet or IEEE 802.11 adapters with a 6-byte hardware address.
// Adapters are queried again when the last query is older than the time-out.
//
// Settings come from the profile file velos.ini (VelosIniPath()):
//   [Shared]  LocalAdapterCacheTimeoutSeconds=<seconds>  (default 10)
//   [Network] HostName=<name this machine also answers to>  (optional)
//
// Every operation, and the creation of the process-wide instance, runs
// under one lock, so any thread may call it; a resolution under way makes
// other callers wait.
class HostInfo final
{
public:
    struct AdapterAddress
    {
        std::string address;
        std::string hardwareAddress; // "%.2X:%.2X:%.2X:%.2X:%.2X:%.2X"
    };

    static constexpr std::size_t kMaxNonLocalNames = 50;

    // The process-wide, active instance on the system's network layer,
    // created on first use and kept until the process ends.
    static HostInfo &Instance();

    // An inactive instance answers from its lists only: every name that is
    // not known local is taken as not local, without resolving it.
    HostInfo(std::unique_ptr<IHostNetwork> network, const IniFile &velosIni, bool active = true);
    ~HostInfo();

    HostInfo(const HostInfo &) = delete;
    HostInfo &operator=(const HostInfo &) = delete;

    bool IsLocal(std::u16string_view host);

    // The adapter cache, queried again first when it is out of date.
    std::vector<AdapterAddress> LocalAdapters();

    std::chrono::seconds AdapterCacheTimeout() const noexcept { return m_cacheTimeout; }

private:
    struct CachedAddress
    {
        QHostAddress address;
        std::string hardwareAddress;
    };

    void AddLocalName(std::u16string name);
    bool IsKnownLocal(std::u16string_view host) const;
    bool IsKnownNonLocal(std::u16string_view host) const;
    void RememberNonLocal(std::u16string_view host);
    bool ResolvesToThisMachine(std::u16string_view host);
    bool IsLocalAddress(const QHostAddress &address);
    void RefreshAdaptersWhenStale();
    void RefreshAdapters();

    mutable std::mutex m_lock;
    std::unique_ptr<IHostNetwork> m_network;
    bool m_active;
    std::chrono::seconds m_cacheTimeout{10};
    std::vector<std::u16string> m_localNames;
    std::deque<std::u16string> m_nonLocalNames;
    std::vector<CachedAddress> m_adapterCache;
    std::optional<std::chrono::steady_clock::time_point> m_lastAdapterQuery;
};

} // namespace cv::krn::osdep
