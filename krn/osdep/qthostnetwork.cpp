#include "krn/osdep/qthostnetwork.h"

#include "krn/osdep/notresolvedexception.h"

#include <QHostInfo>
#include <QNetworkInterface>
#include <QStringList>

namespace cv::krn::osdep {

namespace {

NetworkAdapter::Type TypeOf(QNetworkInterface::InterfaceType type)
{
    switch (type) {
    case QNetworkInterface::Ethernet:
        return NetworkAdapter::Type::Ethernet;
    case QNetworkInterface::Wifi: // the same value as Ieee80211
        return NetworkAdapter::Type::Wireless;
    default:
        return NetworkAdapter::Type::Other;
    }
}

// Qt gives "AA:BB:CC:DD:EE:FF"; anything unexpected yields no bytes.
std::vector<std::uint8_t> HardwareBytes(const QString &text)
{
    std::vector<std::uint8_t> bytes;
    if (text.isEmpty())
        return bytes;
    for (const QString &part : text.split(QLatin1Char(':'))) {
        bool ok = false;
        const uint value = part.toUInt(&ok, 16);
        if (!ok || part.size() != 2 || value > 0xFF)
            return {};
        bytes.push_back(static_cast<std::uint8_t>(value));
    }
    return bytes;
}

} // namespace

std::u16string QtHostNetwork::LocalHostName()
{
    return QHostInfo::localHostName().toStdU16String();
}

std::vector<QHostAddress> QtHostNetwork::Resolve(std::u16string_view host)
{
    const QString name = QString::fromUtf16(host.data(), static_cast<qsizetype>(host.size()));
    // An address text is its own answer; QHostInfo would ask the name service
    // for a reverse lookup first.
    if (const QHostAddress literal(name); !literal.isNull())
        return {literal};
    const QHostInfo info = QHostInfo::fromName(name);
    if (info.error() != QHostInfo::NoError || info.addresses().isEmpty())
        throw NotResolvedException("HostInfo", __LINE__);
    const QList<QHostAddress> addresses = info.addresses();
    return std::vector<QHostAddress>(addresses.begin(), addresses.end());
}

std::optional<std::vector<NetworkAdapter>> QtHostNetwork::Adapters()
{
    std::vector<NetworkAdapter> adapters;
    for (const QNetworkInterface &interface : QNetworkInterface::allInterfaces()) {
        NetworkAdapter adapter;
        adapter.type = TypeOf(interface.type());
        adapter.hardwareAddress = HardwareBytes(interface.hardwareAddress());
        for (const QNetworkAddressEntry &entry : interface.addressEntries())
            adapter.addresses.push_back(entry.ip());
        adapters.push_back(std::move(adapter));
    }
    return adapters;
}

} // namespace cv::krn::osdep
