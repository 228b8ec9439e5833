#include "krn/osdep/hostinfo.h"
#include "krn/osdep/inifile.h"

#include "fakehostnetwork.h"
#include "krn/osdep/qthostnetwork.h"
#include "nameservicecount.h"

#include <gtest/gtest.h>

#include <QHostInfo>

#include <algorithm>

namespace cv::krn::osdep {
namespace {

using Type = NetworkAdapter::Type;

NetworkAdapter Adapter(Type type, std::vector<std::uint8_t> hardware, std::vector<const char *> addresses)
{
    NetworkAdapter adapter{type, std::move(hardware), {}};
    for (const char *address : addresses)
        adapter.addresses.emplace_back(QString::fromLatin1(address));
    return adapter;
}

const std::vector<std::uint8_t> kMac = {0x0a, 0x1b, 0x2c, 0x3d, 0x4e, 0x5f};

class KrnHostInfo : public ::testing::Test
{
protected:
    HostInfo &Make(const std::string &velosIni = {}, bool active = true)
    {
        m_info = std::make_unique<HostInfo>(std::make_unique<krntest::FakeHostNetwork>(m_net),
                                            IniFile::Parse(velosIni), active);
        return *m_info;
    }

    void Name(const std::u16string &name, std::vector<const char *> addresses)
    {
        auto &entry = m_net->names[name];
        for (const char *address : addresses)
            entry.emplace_back(QString::fromLatin1(address));
    }

    std::size_t ResolveCount(std::u16string_view name) const
    {
        return static_cast<std::size_t>(std::count(m_net->resolved.begin(), m_net->resolved.end(), name));
    }

    std::shared_ptr<krntest::FakeHostNetwork::State> m_net = std::make_shared<krntest::FakeHostNetwork::State>();
    std::unique_ptr<HostInfo> m_info;
};

TEST_F(KrnHostInfo, OwnNamesAreLocalWithoutAsking)
{
    m_net->hostName = u"build-server-number-seven";
    HostInfo &info = Make("[Network]\nHostName=velos-alias\n");
    for (const char16_t *name : {u"localhost", u"velos-alias", u"build-server-number-seven", u"build-server-nu"})
        EXPECT_TRUE(info.IsLocal(name)) << QString::fromUtf16(name).toStdString();
    EXPECT_TRUE(m_net->resolved.empty());
    EXPECT_EQ(m_net->adapterQueries, 0);
}

TEST_F(KrnHostInfo, AnUnresolvableNameIsRememberedAsNotLocal)
{
    HostInfo &info = Make();
    EXPECT_FALSE(info.IsLocal(u"nowhere.invalid"));
    EXPECT_FALSE(info.IsLocal(u"nowhere.invalid"));
    EXPECT_EQ(ResolveCount(u"nowhere.invalid"), 1u);
}

TEST_F(KrnHostInfo, TheFiftyFirstNonLocalNameEvictsTheFirst)
{
    HostInfo &info = Make();
    for (int i = 1; i <= 51; ++i)
        EXPECT_FALSE(info.IsLocal(u"host" + QString::number(i).toStdU16String()));
    EXPECT_FALSE(info.IsLocal(u"host2"));
    EXPECT_EQ(ResolveCount(u"host2"), 1u);
    EXPECT_FALSE(info.IsLocal(u"host1"));
    EXPECT_EQ(ResolveCount(u"host1"), 2u);
}

TEST_F(KrnHostInfo, OnlyLoopbackAndEthernetOrWirelessAddressesAreLocal)
{
    m_net->adapters = std::vector<NetworkAdapter>{
        Adapter(Type::Ethernet, kMac, {"192.0.2.10", "fe80::1%2", "0.0.0.0", "::"}),
        Adapter(Type::Wireless, kMac, {"198.51.100.7", "255.255.255.255"}),
        Adapter(Type::Other, kMac, {"203.0.113.9"}),
        Adapter(Type::Ethernet, {1, 2, 3, 4, 5, 6, 7, 8}, {"203.0.113.20"}),
        Adapter(Type::Ethernet, {}, {"203.0.113.21"}),
    };
    Name(u"eth", {"192.0.2.10"});
    Name(u"wifi", {"203.0.113.99", "198.51.100.7"});
    Name(u"linklocal", {"fe80::1"});
    Name(u"tunnel", {"203.0.113.9"});
    Name(u"tunnel-with-loopback", {"203.0.113.9", "127.4.5.6"});
    Name(u"long-hardware", {"203.0.113.20"});
    Name(u"no-hardware", {"203.0.113.21"});
    Name(u"unspecified", {"0.0.0.0"});
    Name(u"unspecified6", {"::"});
    Name(u"broadcast", {"255.255.255.255"});
    Name(u"loop6", {"::1"});
    HostInfo &info = Make();

    const std::pair<const char16_t *, bool> table[] = {
        {u"eth", true},           {u"wifi", true},          {u"linklocal", true},  {u"tunnel", false},
        {u"tunnel-with-loopback", true}, {u"long-hardware", false}, {u"no-hardware", false},
        {u"unspecified", false},  {u"unspecified6", false}, {u"broadcast", false}, {u"loop6", true},
    };
    for (const auto &[name, local] : table)
        EXPECT_EQ(info.IsLocal(name), local) << QString::fromUtf16(name).toStdString();

    // Found local once, a name is not resolved again.
    EXPECT_TRUE(info.IsLocal(u"eth"));
    EXPECT_EQ(ResolveCount(u"eth"), 1u);
}

TEST_F(KrnHostInfo, TheAdapterCacheHoldsAddressesWithTheirHardwareText)
{
    m_net->adapters = std::vector<NetworkAdapter>{
        Adapter(Type::Ethernet, kMac, {"192.0.2.10"}),
        Adapter(Type::Other, kMac, {"203.0.113.9"}),
    };
    const std::vector<HostInfo::AdapterAddress> cache = Make().LocalAdapters();
    ASSERT_EQ(cache.size(), 3u);
    EXPECT_EQ(cache[0].address, "192.0.2.10");
    EXPECT_EQ(cache[0].hardwareAddress, "0A:1B:2C:3D:4E:5F");
    EXPECT_EQ(cache[1].address, "127.0.0.1");
    EXPECT_EQ(cache[1].hardwareAddress, "00:00:00:00:00:00");
    EXPECT_EQ(cache[2].address, "::1");
}

TEST_F(KrnHostInfo, TheAdapterCacheIsQueriedAgainAfterItsTimeOut)
{
    m_net->adapters = std::vector<NetworkAdapter>{Adapter(Type::Ethernet, kMac, {"192.0.2.10"})};
    for (const char16_t *name : {u"a", u"b", u"c"})
        Name(name, {"192.0.2.10"});

    HostInfo &cached = Make();
    EXPECT_EQ(cached.AdapterCacheTimeout(), std::chrono::seconds(10));
    EXPECT_TRUE(cached.IsLocal(u"a"));
    EXPECT_TRUE(cached.IsLocal(u"b"));
    EXPECT_EQ(m_net->adapterQueries, 1);

    m_net->adapterQueries = 0;
    HostInfo &uncached = Make("[Shared]\nLocalAdapterCacheTimeoutSeconds=0\n");
    EXPECT_EQ(uncached.AdapterCacheTimeout(), std::chrono::seconds(0));
    EXPECT_TRUE(uncached.IsLocal(u"a"));
    // A failed query keeps what the last one found.
    m_net->adapters.reset();
    EXPECT_TRUE(uncached.IsLocal(u"b"));
    EXPECT_EQ(m_net->adapterQueries, 2);

    EXPECT_EQ(Make("[Shared]\nLocalAdapterCacheTimeoutSeconds=soon\n").AdapterCacheTimeout(), std::chrono::seconds(10));
}

TEST_F(KrnHostInfo, AnInactiveInstanceNeverResolves)
{
    Name(u"loop", {"127.0.0.1"});
    HostInfo &info = Make({}, false);
    EXPECT_TRUE(info.IsLocal(u"localhost"));
    EXPECT_FALSE(info.IsLocal(u"loop"));
    EXPECT_TRUE(m_net->resolved.empty());
}

TEST(KrnHostInfoSystem, KnowsThisMachine)
{
    HostInfo &info = HostInfo::Instance();
    EXPECT_EQ(&info, &HostInfo::Instance());
    EXPECT_TRUE(info.IsLocal(u"localhost"));
    EXPECT_TRUE(info.IsLocal(QHostInfo::localHostName().toStdU16String()));
    EXPECT_TRUE(info.IsLocal(u"127.0.0.1"));
    EXPECT_TRUE(info.IsLocal(u"::1"));
    EXPECT_FALSE(info.IsLocal(u"192.0.2.1"));
}

TEST(KrnHostInfoSystem, ALiteralAddressIsItsOwnAnswer)
{
    QtHostNetwork network;
    const int before = krntest::NameServiceQueries();
    EXPECT_EQ(network.Resolve(u"192.0.2.1"), std::vector<QHostAddress>{QHostAddress(QStringLiteral("192.0.2.1"))});
    EXPECT_EQ(network.Resolve(u"2001:db8::7"), std::vector<QHostAddress>{QHostAddress(QStringLiteral("2001:db8::7"))});
    EXPECT_EQ(krntest::NameServiceQueries(), before) << "the name service was asked";

    // A name goes to the name service, and the count sees it.
    network.Resolve(u"localhost");
    EXPECT_GT(krntest::NameServiceQueries(), before);
}

} // namespace
} // namespace cv::krn::osdep
