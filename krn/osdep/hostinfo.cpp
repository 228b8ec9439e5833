#include "krn/osdep/hostinfo.h"

#include "krn/osdep/configpaths.h"
#include "krn/osdep/inifile.h"
#include "krn/osdep/notresolvedexception.h"
#include "krn/osdep/qthostnetwork.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

namespace cv::krn::osdep {

namespace {

constexpr std::size_t kComputerNameLength = 15;

bool IsLoopback(const QHostAddress &address)
{
    if (address.protocol() == QAbstractSocket::IPv4Protocol)
        return (address.toIPv4Address() >> 24) == 127;
    if (address.protocol() == QAbstractSocket::IPv6Protocol)
        return address.isEqual(QHostAddress(QHostAddress::LocalHostIPv6));
    return false;
}

// Compares the address bytes only: a link-local scope is not part of an
// address that a resolver hands back.
bool SameAddress(const QHostAddress &a, const QHostAddress &b)
{
    if (a.protocol() != b.protocol())
        return false;
    if (a.protocol() == QAbstractSocket::IPv4Protocol)
        return a.toIPv4Address() == b.toIPv4Address();
    if (a.protocol() == QAbstractSocket::IPv6Protocol) {
        const Q_IPV6ADDR x = a.toIPv6Address();
        const Q_IPV6ADDR y = b.toIPv6Address();
        return std::memcmp(x.c, y.c, sizeof x.c) == 0;
    }
    return false;
}

bool IsUsableAdapterAddress(const QHostAddress &address)
{
    if (address.protocol() == QAbstractSocket::IPv4Protocol) {
        const quint32 value = address.toIPv4Address();
        return value != 0 && value != 0xFFFFFFFFu;
    }
    if (address.protocol() == QAbstractSocket::IPv6Protocol)
        return !SameAddress(address, QHostAddress(QHostAddress::AnyIPv6));
    return false;
}

bool IsQualifyingAdapter(const NetworkAdapter &adapter)
{
    return adapter.hardwareAddress.size() == 6
        && (adapter.type == NetworkAdapter::Type::Ethernet || adapter.type == NetworkAdapter::Type::Wireless);
}

std::string HardwareText(const std::vector<std::uint8_t> &bytes)
{
    char text[18] = {};
    std::snprintf(text, sizeof text, "%.2X:%.2X:%.2X:%.2X:%.2X:%.2X", bytes[0], bytes[1], bytes[2], bytes[3],
                  bytes[4], bytes[5]);
    return text;
}

std::u16string VelosHostName(const IniFile &velosIni)
{
    return velosIni.Value(u"Network", u"HostName").value_or(std::u16string());
}

} // namespace

HostInfo &HostInfo::Instance()
{
    // Never destroyed, so that it outlives every static that might ask it.
    static HostInfo *const instance =
        new HostInfo(std::make_unique<QtHostNetwork>(), IniFile::Load(VelosIniPath()), true);
    return *instance;
}

HostInfo::HostInfo(std::unique_ptr<IHostNetwork> network, const IniFile &velosIni, bool active)
    : m_network(std::move(network))
    , m_active(active)
{
    if (const std::optional<std::uint32_t> seconds = velosIni.UnsignedValue(u"Shared", u"LocalAdapterCacheTimeoutSeconds"))
        m_cacheTimeout = std::chrono::seconds(*seconds);
    const std::u16string hostName = m_network->LocalHostName();
    AddLocalName(u"localhost");
    AddLocalName(VelosHostName(velosIni));
    AddLocalName(hostName);
    AddLocalName(hostName.substr(0, kComputerNameLength));
}

HostInfo::~HostInfo() = default;

bool HostInfo::IsLocal(std::u16string_view host)
{
    const std::lock_guard<std::mutex> guard(m_lock);
    if (IsKnownLocal(host))
        return true;
    if (IsKnownNonLocal(host))
        return false;
    if (m_active && ResolvesToThisMachine(host)) {
        AddLocalName(std::u16string(host));
        return true;
    }
    RememberNonLocal(host);
    return false;
}

std::vector<HostInfo::AdapterAddress> HostInfo::LocalAdapters()
{
    const std::lock_guard<std::mutex> guard(m_lock);
    RefreshAdaptersWhenStale();
    std::vector<AdapterAddress> result;
    for (const CachedAddress &cached : m_adapterCache)
        result.push_back({cached.address.toString().toStdString(), cached.hardwareAddress});
    return result;
}

void HostInfo::AddLocalName(std::u16string name)
{
    if (!name.empty() && !IsKnownLocal(name))
        m_localNames.push_back(std::move(name));
}

bool HostInfo::IsKnownLocal(std::u16string_view host) const
{
    return std::find(m_localNames.begin(), m_localNames.end(), host) != m_localNames.end();
}

bool HostInfo::IsKnownNonLocal(std::u16string_view host) const
{
    return std::find(m_nonLocalNames.begin(), m_nonLocalNames.end(), host) != m_nonLocalNames.end();
}

void HostInfo::RememberNonLocal(std::u16string_view host)
{
    if (m_nonLocalNames.size() >= kMaxNonLocalNames)
        m_nonLocalNames.pop_front();
    m_nonLocalNames.emplace_back(host);
}

bool HostInfo::ResolvesToThisMachine(std::u16string_view host)
{
    std::vector<QHostAddress> addresses;
    try {
        addresses = m_network->Resolve(host);
    } catch (const NotResolvedException &) {
        return false;
    }
    return std::any_of(addresses.begin(), addresses.end(),
                       [this](const QHostAddress &address) { return IsLocalAddress(address); });
}

bool HostInfo::IsLocalAddress(const QHostAddress &address)
{
    if (IsLoopback(address))
        return true;
    RefreshAdaptersWhenStale();
    return std::any_of(m_adapterCache.begin(), m_adapterCache.end(),
                       [&address](const CachedAddress &cached) { return SameAddress(cached.address, address); });
}

void HostInfo::RefreshAdaptersWhenStale()
{
    const auto now = std::chrono::steady_clock::now();
    if (!m_lastAdapterQuery || now - *m_lastAdapterQuery >= m_cacheTimeout)
        RefreshAdapters();
}

void HostInfo::RefreshAdapters()
{
    const std::optional<std::vector<NetworkAdapter>> adapters = m_network->Adapters();
    if (!adapters)
        return;
    std::vector<CachedAddress> cache;
    for (const NetworkAdapter &adapter : *adapters) {
        if (!IsQualifyingAdapter(adapter))
            continue;
        const std::string hardware = HardwareText(adapter.hardwareAddress);
        for (const QHostAddress &address : adapter.addresses) {
            if (IsUsableAdapterAddress(address))
                cache.push_back({address, hardware});
        }
    }
    cache.push_back({QHostAddress(QHostAddress::LocalHost), "00:00:00:00:00:00"});
    cache.push_back({QHostAddress(QHostAddress::LocalHostIPv6), "00:00:00:00:00:00"});
    m_adapterCache = std::move(cache);
    m_lastAdapterQuery = std::chrono::steady_clock::now();
}

} // namespace cv::krn::osdep
