#include "dunemere/config.h"
#include "dunemere/taggedtext.h"
#include "krn/osdep/hostinfo.h"
#include "krn/osdep/inifile.h"
#include "krn/osdep/notresolvedexception.h"
#include "log/ilogimp.h"
#include "sorvik/packedversion.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <QHostInfo>

#include <filesystem>
#include <memory>
#include <string>

namespace {

using PLUGIN::Config;
using PLUGIN::TaggedText;

// Only "thishost" is this machine; nothing is resolved.
bool OnlyThisHost(std::u16string_view host)
{
    return host == u"thishost";
}

Config Parse(std::u16string_view text)
{
    return Config(text, nullptr, OnlyThisHost);
}

TEST(Config, EmptyTextKeepsEveryDefault)
{
    const Config config = Parse(u"");
    EXPECT_EQ(config.GetServer(), u"");
    EXPECT_EQ(config.GetPortName(), u"");
    EXPECT_EQ(config.GetReceiveTimeout(), 20000u);
    EXPECT_EQ(config.GetQueryTimeout(), 20001u);
    EXPECT_EQ(config.GetSendTimeout(), 8000u);
    EXPECT_EQ(config.GetServerVersion(), 0x4800000u);
    EXPECT_TRUE(config.GetStartEngine());
    EXPECT_FALSE(config.GetSyncPlugins());
    EXPECT_FALSE(config.GetFileSystemIndexOnly());
    EXPECT_FALSE(config.IsLoggedIn());
    EXPECT_EQ(config.GetUserSid(), u"");
    // No server element: not known to be this machine.
    EXPECT_FALSE(config.IsLocalServer());
}

TEST(Config, ReadsEveryElementInAnyOrder)
{
    const Config config =
        Parse(u"<sendtimeout>100</sendtimeout><portname> P1\t</portname><server>thishost</server>"
              u"<receivetimeout>300</receivetimeout><querytimeout>200</querytimeout>"
              u"<clientidentificationsecretkey>k e y</clientidentificationsecretkey>"
              u"<clientidentificationstring>app</clientidentificationstring><syncplugins>2</syncplugins>"
              u"<fsionly>yes</fsionly>");
    EXPECT_EQ(config.GetServer(), u"thishost");
    EXPECT_EQ(config.GetPortName(), u"P1");
    EXPECT_EQ(config.GetSendTimeout(), 100u);
    EXPECT_EQ(config.GetQueryTimeout(), 200u);
    EXPECT_EQ(config.GetReceiveTimeout(), 300u);
    EXPECT_EQ(config.GetClientIdentificationString(), u"app");
    EXPECT_EQ(config.GetClientIdentificationSecretKey(), u"k e y");
    EXPECT_TRUE(config.GetSyncPlugins());
    EXPECT_TRUE(config.GetFileSystemIndexOnly());
}

TEST(Config, AnotherMachineLowersTheQueryTimeoutUnlessGiven)
{
    EXPECT_EQ(Parse(u"<server>elsewhere</server>").GetQueryTimeout(), 5000u);
    EXPECT_EQ(Parse(u"<querytimeout>30000</querytimeout><server>elsewhere</server>").GetQueryTimeout(), 30000u);
    EXPECT_EQ(Parse(u"<server>elsewhere</server><querytimeout>30000</querytimeout>").GetQueryTimeout(), 30000u);
    EXPECT_EQ(Parse(u"<server>thishost</server>").GetQueryTimeout(), 20001u);
    EXPECT_EQ(Parse(u"<server>LocalHost</server>").GetQueryTimeout(), 20001u);
}

// The foundation's host check over a network layer that knows literals only,
// so that nothing is looked up.
class LiteralsOnly final : public cv::krn::osdep::IHostNetwork
{
public:
    std::u16string LocalHostName() override { return u"thishost"; }
    std::vector<QHostAddress> Resolve(std::u16string_view host) override
    {
        const QHostAddress address(QString::fromUtf16(host.data(), static_cast<qsizetype>(host.size())));
        if (address.isNull())
            throw cv::krn::osdep::NotResolvedException();
        return {address};
    }
    std::optional<std::vector<cv::krn::osdep::NetworkAdapter>> Adapters() override { return std::vector<cv::krn::osdep::NetworkAdapter>(); }
};

TEST(Config, TheHostLayerDecidesWhatIsThisMachine)
{
    cv::krn::osdep::HostInfo hosts(std::make_unique<LiteralsOnly>(), cv::krn::osdep::IniFile());
    const auto isLocal = [&](std::u16string_view host) { return hosts.IsLocal(host); };

    // A TEST-NET literal: never contacted.
    const Config remote(u"<server>192.0.2.1</server>", nullptr, isLocal);
    EXPECT_EQ(remote.GetQueryTimeout(), 5000u);
    EXPECT_FALSE(remote.IsLocalServer());
    EXPECT_FALSE(remote.CanStartEngine());

    const Config loopback(u"<server>127.0.0.1</server>", nullptr, isLocal);
    EXPECT_EQ(loopback.GetQueryTimeout(), 20001u);
    EXPECT_TRUE(loopback.CanStartEngine());

    // By default the process-wide instance answers; this host's own name
    // is known without a query.
    const QString name = QHostInfo::localHostName();
    const Config own(u"<server>" + name.toStdU16String() + u"</server>");
    EXPECT_TRUE(own.CanStartEngine());
}

TEST(Config, StartingTheEngineNeedsPermissionThisMachineAndNoPortName)
{
    EXPECT_TRUE(Parse(u"<server>localhost</server>").CanStartEngine());
    EXPECT_FALSE(Parse(u"<server>localhost</server><startengine>NO</startengine>").CanStartEngine());
    EXPECT_FALSE(Parse(u"<server>localhost</server><startengine>no</startengine>").CanStartEngine());
    EXPECT_TRUE(Parse(u"<server>localhost</server><startengine>false</startengine>").CanStartEngine());
    EXPECT_FALSE(Parse(u"<server>localhost</server><portname>P</portname>").CanStartEngine());
    EXPECT_FALSE(Parse(u"<server>localhost</server><portname>P</portname>").IsLocalServer());
    EXPECT_FALSE(Parse(u"<server>elsewhere</server>").CanStartEngine());
}

TEST(Config, FlagsFollowTheirOwnSpelling)
{
    EXPECT_FALSE(Parse(u"<fsionly>Yes</fsionly>").GetFileSystemIndexOnly());
    EXPECT_FALSE(Parse(u"<fsionly>YES</fsionly>").GetFileSystemIndexOnly());
    EXPECT_FALSE(Parse(u"<syncplugins>0</syncplugins>").GetSyncPlugins());
    EXPECT_FALSE(Parse(u"<syncplugins>-1</syncplugins>").GetSyncPlugins());
    EXPECT_FALSE(Parse(u"<syncplugins>on</syncplugins>").GetSyncPlugins());
    EXPECT_TRUE(Parse(u"<syncplugins>7x</syncplugins>").GetSyncPlugins());
}

TEST(Config, NumbersTakeTheLongestValidPrefix)
{
    EXPECT_EQ(Parse(u"<sendtimeout>12abc</sendtimeout>").GetSendTimeout(), 12u);
    EXPECT_EQ(Parse(u"<sendtimeout>abc</sendtimeout>").GetSendTimeout(), 0u);
    EXPECT_EQ(Parse(u"<sendtimeout>0x10</sendtimeout>").GetSendTimeout(), 0u); // decimal only
    EXPECT_EQ(Parse(u"<sendtimeout>99999999999</sendtimeout>").GetSendTimeout(), 0xFFFFFFFFu);
    EXPECT_EQ(PLUGIN::ReadUnsigned(u"0x1F", 0), 31u);
    EXPECT_EQ(PLUGIN::ReadUnsigned(u"017", 0), 15u);
    EXPECT_EQ(PLUGIN::ReadUnsigned(u"  42", 0), 42u);
    EXPECT_EQ(PLUGIN::ReadUnsigned(u"0x", 0), 0u);
    EXPECT_EQ(PLUGIN::ReadUnsigned(u"-1", 10), 0xFFFFFFFFu);
    EXPECT_EQ(PLUGIN::ReadSigned(u"-2147483649", 10), INT32_MIN);
    EXPECT_EQ(PLUGIN::ReadSigned(u"2147483648", 10), INT32_MAX);
}

TEST(Config, AnElementWithoutClosingTagHidesWhatFollows)
{
    const Config config = Parse(u"<server>thishost</server><portname>P<sendtimeout>5</sendtimeout>"
                                u"<receivetimeout>7</receivetimeout>");
    EXPECT_EQ(config.GetServer(), u"thishost");
    EXPECT_EQ(config.GetPortName(), u"");
    EXPECT_EQ(config.GetSendTimeout(), 8000u);
    EXPECT_EQ(config.GetReceiveTimeout(), 20000u);

    // Names are case-sensitive; a closing tag of another case does not close.
    EXPECT_EQ(Parse(u"<Server>x</Server><server>y</server>").GetServer(), u"y");
    EXPECT_EQ(Parse(u"<server>x</SERVER><portname>p</portname>").GetPortName(), u"");
}

TEST(Config, VersionsAbove18SettleOn1800)
{
    Config config = Parse(u"");
    config.SetServerVersion(sorvik::PackVersion(17, 0, 0));
    EXPECT_EQ(config.GetServerVersion(), sorvik::PackVersion(17, 0, 0));
    config.SetServerVersion(sorvik::PackVersion(19, 0, 0));
    EXPECT_EQ(config.GetServerVersion(), 0x4800000u);
    config.SetServerVersion(sorvik::PackVersion(18, 1, 0));
    EXPECT_EQ(config.GetServerVersion(), 0x4800000u);
    config.SetServerVersion(sorvik::PackVersion(18, 0, 1));
    EXPECT_EQ(config.GetServerVersion(), 0x4800000u);
    config.SetServerVersion(sorvik::PackVersion(18, 0, 0, 7096));
    EXPECT_EQ(config.GetServerVersion(), sorvik::PackVersion(18, 0, 0, 7096));
    config.SetServerVersion(sorvik::PackVersion(2, 0, 5));
    EXPECT_EQ(config.GetServerVersion(), sorvik::PackVersion(2, 0, 5));
}

TEST(TaggedText, AttributesMayBeQuoted)
{
    TaggedText text(u"<log a=1 b=\"two words\"\tc='x y' d = e flag f=\" padded \">v</log>");
    const auto element = text.Find(u"log");
    ASSERT_TRUE(element);
    EXPECT_EQ(element->content, u"v");
    const auto &attributes = element->attributes;
    EXPECT_EQ(attributes.at(u"a"), u"1");
    EXPECT_EQ(attributes.at(u"b"), u"two words");
    EXPECT_EQ(attributes.at(u"c"), u"x y");
    EXPECT_EQ(attributes.at(u"flag"), u"");
    EXPECT_EQ(attributes.at(u"f"), u" padded ");
    EXPECT_EQ(attributes.count(u"e"), 1u); // "d = e" splits at the blanks
}

TEST(TaggedText, ContentIsTrimmedOfBlanksAndTabsOnly)
{
    TaggedText text(u"<a> \t x \n</a><b>\r\ny\r\n</b><c></c>");
    EXPECT_EQ(text.Find(u"a")->content, u"x \n");
    EXPECT_EQ(text.Find(u"b")->content, u"\r\ny\r\n");
    EXPECT_EQ(text.Find(u"c")->content, u"");
    EXPECT_FALSE(text.Find(u"d"));
    EXPECT_EQ(text.Find(u"a")->content, u"x \n"); // lookups start again at the beginning
}

class ConfigWithLog : public ::testing::Test
{
protected:
    testsupport::TempDir dir; // outlives the log and its file
    cv::util::file::log::ILogImp log;
};

TEST_F(ConfigWithLog, BitmaskEnablesVerbosityAndNamesTheFile)
{
    const std::string file = dir.file("dsa.log").string();
    const std::u16string name(file.begin(), file.end());
    const Config config(u"<logfile bitmask=0x20>" + name + u"</logfile>", log);
    EXPECT_EQ(log.GetInfoMask(), 0x20u);
    char16_t stored[512] = {};
    ASSERT_TRUE(log.GetFileName(stored, 512));
    EXPECT_EQ(std::u16string(stored), name);
    EXPECT_TRUE(log.Info(nullptr, 0, 5));
    EXPECT_FALSE(log.Info(nullptr, 0, 4));
    EXPECT_TRUE(std::filesystem::exists(file)); // the verbosity-5 line went there
}

TEST_F(ConfigWithLog, BitmaskBasesAndOutputFlagsKeepTheSwitch)
{
    log.SwitchOn(0);
    Config(u"<logfile bitmask='010' outbitmask=\"0x1\"></logfile>", log);
    EXPECT_EQ(log.GetInfoMask(), 8u);
    EXPECT_EQ(log.GetOutputFlags(), cv::util::file::log::kOutputConsole | cv::util::file::log::kOutputAdditionalSwitch);

    log.SwitchOff();
    Config(u"<logfile bitmask=12 outbitmask=16></logfile>", log);
    EXPECT_EQ(log.GetInfoMask(), 12u);
    EXPECT_EQ(log.GetOutputFlags(), 0u);
}

} // namespace
