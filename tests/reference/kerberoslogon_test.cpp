#include "serverfixture.h"

#include "dunemere/config.h"
#include "dunemere/directstoreaccess.h"
#include "dunemere/kerberosclientsid.h"
#include "dunemere/requestorbase.h"
#include "dunemere/tointmsgda.h"
#include "log/ilogimp.h"
#include "support/kdcrealm.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <QString>

#include <fstream>
#include <sstream>

namespace {

using cv::vek::rovo::RequestorBase;
using namespace cv::vek::rovo::dunemere;
using testsupport::KdcRealm;
using ::testing::HasSubstr;

[[maybe_unused]] const bool g_registry = (reftest::InstallServerRegistry(), true);

std::string Utf8(const std::u16string &text)
{
    return QString::fromStdU16String(text).toStdString();
}

class KerberosLogOnTest : public reftest::ServerTest
{
protected:
    std::unique_ptr<testsupport::SorvikProcess> StartKerberized(std::vector<std::string> extra = {})
    {
        std::vector<std::string> arguments{"--portname", "K", "--keytab", m_realm.KeytabPath().string(), "--principal",
                                           KdcRealm::kServiceName};
        arguments.insert(arguments.end(), extra.begin(), extra.end());
        return Start(arguments, "K", m_dir.file("server.out"));
    }
    std::string ServerOutput() const
    {
        std::ostringstream text;
        text << std::ifstream(m_dir.file("server.out")).rdbuf();
        return text.str();
    }
    // The message of the protocol error a log-on raises.
    std::string LogOnError(PLUGIN::Config &config)
    {
        RequestorBase requestor(config, m_log);
        try {
            requestor.Connect(false, 3);
        } catch (const DataCache::ToIntMsgDa &error) {
            EXPECT_EQ(error.Code(), 181u);
            EXPECT_FALSE(requestor.IsConnected());
            return Utf8(error.Message());
        }
        ADD_FAILURE() << "logged on";
        return {};
    }

    KdcRealm m_realm;
    cv::util::file::log::ILogImp m_log;
    PLUGIN::Config m_config{u"<server>localhost</server><portname>K</portname>"};
};

TEST_F(KerberosLogOnTest, MutualLogOnThenStatisticsAndBothSidesKnowTheUser)
{
    auto server = StartKerberized();
    RequestorBase requestor(m_config, m_log);
    requestor.Connect(false, 3);
    EXPECT_TRUE(m_config.IsLoggedIn());
    EXPECT_EQ(Utf8(m_config.GetUserName()), m_realm.UserPrincipal());

    auto *access = CreateDirectStoreAccess(u"K", 0);
    EXPECT_EQ(access->GetElementCount(8), 0u) << "a category-5 request after the log-on";
    access->Release();
    EXPECT_THAT(ServerOutput(), HasSubstr("logged on: " + m_realm.UserPrincipal()));
}

TEST_F(KerberosLogOnTest, NoCredentialsCacheFailsTheLogOn)
{
    auto server = StartKerberized();
    m_realm.DestroyCredentials();
    EXPECT_THAT(LogOnError(m_config), HasSubstr("KerberosClient Error: Authentication failed 'NO_CREDENTIALS'."));
}

TEST_F(KerberosLogOnTest, TargetingAnotherServicePrincipalFailsWithItsName)
{
    auto server = StartKerberized({"--client-target", m_realm.OtherServicePrincipal()});
    EXPECT_THAT(LogOnError(m_config), HasSubstr("KerberosClient Error: Authentication failed 'WRONG_PRINCIPAL'."));
}

TEST_F(KerberosLogOnTest, ServerSkippingMutualAuthenticationIsNotTrusted)
{
    auto server = StartKerberized({"--skip-mutual-authentication"});
    EXPECT_THAT(LogOnError(m_config), HasSubstr("KerberosClient Error: no mutual authentication."));
    EXPECT_FALSE(m_config.IsLoggedIn());
}

TEST_F(KerberosLogOnTest, SidLogOnIsAcceptedForALocalAccountInOneStep)
{
    auto server = StartKerberized();
    const std::string uid = std::to_string(::getuid());
    const std::u16string sid = u"S-1-22-1-" + std::u16string(uid.begin(), uid.end());
    RequestorBase requestor(m_config, m_log,
                            [&](const PLUGIN::IConfig &) { return new PLUGIN::CKerberosClientSID(sid); });
    requestor.Connect(false, 3);
    EXPECT_TRUE(m_config.IsLoggedIn());
    EXPECT_FALSE(m_config.GetUserName().empty());

    RequestorBase unknown(m_config, m_log, [](const PLUGIN::IConfig &) {
        return new PLUGIN::CKerberosClientSID(u"S-1-5-21-1-2-3-500");
    });
    EXPECT_THROW(unknown.Connect(false, 3), DataCache::ToIntMsgDa);
}

} // namespace
