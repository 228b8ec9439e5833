#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/kerberosclient.h"
#include "dunemere/kerberosclientsid.h"
#include "dunemere/kerberosstatus.h"
#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/tointmsgda.h"
#include "krn/utf.h"
#include "reference/kerberosaccept/kerberosacceptor.h"
#include "support/kdcrealm.h"

#include <gmock/gmock.h>
#include <gssapi/gssapi.h>
#include <gtest/gtest.h>
#include <krb5/krb5.h>

#include <pwd.h>
#include <unistd.h>

#include <chrono>
#include <memory>
#include <thread>

namespace {

using cv::krn::ByteBuffer;
using cv::krn::ToUtf8;
using cv::vek::rovo::CAuthenticationRequestTransferData;
using cv::vek::rovo::kerberos::KerberosAcceptor;
using Outcome = KerberosAcceptor::Outcome;
using PLUGIN::CKerberosClient;
using PLUGIN::CKerberosClientSID;
using testing::MatchesRegex;

// The requestor holds the one reference and releases it.
template<typename Client>
struct Releaser
{
    void operator()(Client *client) const { client->Release(); }
};
template<typename Client>
using ClientPtr = std::unique_ptr<Client, Releaser<Client>>;

ByteBuffer PermissionAnswer(const std::string &target)
{
    ByteBuffer buffer;
    EXPECT_TRUE(cv::vek::rovo::tResponseTransferData(GUID{}, 2, 0, cv::krn::ToUtf16(target)).Serialize(buffer));
    return buffer;
}

ByteBuffer StepAnswer(std::int32_t status, const std::vector<std::uint8_t> &token)
{
    ByteBuffer buffer;
    EXPECT_TRUE(cv::vek::rovo::tResponseTransferAuthentication(GUID{}, status, token).Serialize(buffer));
    return buffer;
}

// The message of the error the call raises, as UTF-8; empty when none.
template<typename Call>
std::string ErrorOf(Call &&call)
{
    try {
        call();
    } catch (const DataCache::ToIntMsgDa &error) {
        EXPECT_EQ(error.Code(), 181u);
        return ToUtf8(error.Message());
    }
    ADD_FAILURE() << "no DataCache::ToIntMsgDa raised";
    return {};
}

std::string AuthenticationFailed(const std::string &name)
{
    return "^KerberosClient\\([0-9]+\\): ERROR\\(181\\): KerberosClient Error: Authentication failed '" + name +
           "'\\.$";
}

const char *const kNoMutualAuthentication =
    "^KerberosClient\\([0-9]+\\): ERROR\\(181\\): KerberosClient Error: no mutual authentication\\.$";

TEST(KerberosFailureName, MapsStatusesOntoTheLogOnErrorNames)
{
    const struct
    {
        OM_uint32 major;
        std::int32_t minor;
        std::u16string_view name;
    } table[] = {
        {GSS_S_NO_CRED, 0, u"NO_CREDENTIALS"},
        {GSS_S_CREDENTIALS_EXPIRED, 0, u"NO_CREDENTIALS"},
        {GSS_S_BAD_NAME, 0, u"TARGET_UNKNOWN"},
        {GSS_S_BAD_NAMETYPE, 0, u"TARGET_UNKNOWN"},
        {GSS_S_DEFECTIVE_TOKEN, 0, u"INVALID_TOKEN"},
        {GSS_S_BAD_SIG, 0, u"INVALID_TOKEN"},
        {GSS_S_NO_CONTEXT, 0, u"INVALID_HANDLE"},
        {GSS_S_CALL_INACCESSIBLE_READ | GSS_S_FAILURE, 0, u"INTERNAL_ERROR"},
        {GSS_S_FAILURE, KRB5KDC_ERR_S_PRINCIPAL_UNKNOWN, u"TARGET_UNKNOWN"},
        {GSS_S_FAILURE, KRB5KRB_AP_WRONG_PRINC, u"WRONG_PRINCIPAL"},
        {GSS_S_FAILURE, KRB5_KT_NOTFOUND, u"WRONG_PRINCIPAL"},
        {GSS_S_FAILURE, KRB5_KDC_UNREACH, u"NO_AUTHENTICATING_AUTHORITY"},
        {GSS_S_FAILURE, KRB5KRB_AP_ERR_TKT_EXPIRED, u"NO_CREDENTIALS"},
        {GSS_S_FAILURE, KRB5KDC_ERR_CLIENT_REVOKED, u"LOGON_DENIED"},
        {GSS_S_FAILURE, KRB5KRB_AP_ERR_MODIFIED, u"INVALID_TOKEN"},
        {GSS_S_FAILURE, 12345, u"unknown errror"},
        {GSS_S_CONTEXT_EXPIRED, 0, u"unknown errror"},
    };
    for (const auto &row : table)
        EXPECT_EQ(PLUGIN::KerberosFailureName(row.major, std::uint32_t(row.minor)), row.name)
            << row.major << " " << row.minor;
}

class KerberosLogOn : public testing::Test
{
protected:
    // Runs the exchange as the requestor does, until a side ends it.
    void Exchange(CKerberosClient &client, KerberosAcceptor &acceptor, const std::string &target)
    {
        CAuthenticationRequestTransferData record;
        ASSERT_TRUE(client.StartAuthentication(PermissionAnswer(target), record));
        for (int step = 0; step < 5; ++step) {
            const auto answer = acceptor.Step(record.Token());
            ASSERT_NE(answer.outcome, Outcome::Failed) << answer.error;
            const std::int32_t status = answer.outcome == Outcome::Complete ? 1 : 3;
            const bool more = client.ContinueAuthentication(StepAnswer(status, answer.token), record);
            if (answer.outcome == Outcome::Complete) {
                EXPECT_FALSE(more);
                return;
            }
            ASSERT_TRUE(more);
        }
        FAIL() << "the exchange did not end";
    }

    KerberosAcceptor Acceptor() { return {m_realm.KeytabPath().string(), m_realm.ServicePrincipal()}; }

    testsupport::KdcRealm m_realm;
};

TEST_F(KerberosLogOn, MutualAuthenticationNamesBothSides)
{
    for (const std::string &target : {std::string(testsupport::KdcRealm::kServiceName), m_realm.ServicePrincipal()}) {
        SCOPED_TRACE(target);
        ClientPtr<CKerberosClient> client(new CKerberosClient);
        KerberosAcceptor acceptor(m_realm.KeytabPath().string(), target);
        Exchange(*client, acceptor, acceptor.ServicePrincipal());
        EXPECT_EQ(acceptor.ClientName(), m_realm.UserPrincipal());
        EXPECT_EQ(ToUtf8(client->GetUserName()), m_realm.UserPrincipal());
        // Done from the client's side: nothing more to send.
        CAuthenticationRequestTransferData record;
        EXPECT_FALSE(client->ContinueAuthentication(StepAnswer(1, {}), record));
    }
}

TEST_F(KerberosLogOn, UserWithoutTicketCacheGetsNoCredentialsAtTheFirstStep)
{
    m_realm.DestroyCredentials();
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    EXPECT_EQ(client->GetUserName(), u"");
    CAuthenticationRequestTransferData record;
    EXPECT_THAT(ErrorOf([&] { client->StartAuthentication(PermissionAnswer(m_realm.ServicePrincipal()), record); }),
                MatchesRegex(AuthenticationFailed("NO_CREDENTIALS")));
    EXPECT_TRUE(record.Token().empty());
}

TEST_F(KerberosLogOn, ExpiredTicketMeansNoCredentials)
{
    m_realm.Kinit(m_realm.UserPrincipal(), m_realm.UserPassword(), true, "1s");
    // The ticket's end time has one-second resolution.
    std::this_thread::sleep_for(std::chrono::milliseconds(2100));
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    CAuthenticationRequestTransferData record;
    EXPECT_THAT(ErrorOf([&] { client->StartAuthentication(PermissionAnswer(m_realm.ServicePrincipal()), record); }),
                MatchesRegex(AuthenticationFailed("NO_CREDENTIALS")));
}

TEST_F(KerberosLogOn, TicketObtainedAfterConstructionIsUsed)
{
    m_realm.DestroyCredentials();
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    m_realm.Kinit(m_realm.UserPrincipal(), m_realm.UserPassword());
    KerberosAcceptor acceptor = Acceptor();
    Exchange(*client, acceptor, m_realm.ServicePrincipal());
    EXPECT_EQ(acceptor.ClientName(), m_realm.UserPrincipal());
}

TEST_F(KerberosLogOn, ServiceUnknownToTheKdcIsAnUnknownTarget)
{
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    CAuthenticationRequestTransferData record;
    for (const std::string &target : {std::string("nosuch@localhost"), std::string("")}) {
        EXPECT_THAT(ErrorOf([&] { client->StartAuthentication(PermissionAnswer(target), record); }),
                    MatchesRegex(AuthenticationFailed("TARGET_UNKNOWN")))
            << target;
    }
}

TEST_F(KerberosLogOn, ClientTargetingAnotherServiceIsRefusedOnBothSides)
{
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    KerberosAcceptor acceptor = Acceptor();
    CAuthenticationRequestTransferData record;
    ASSERT_TRUE(client->StartAuthentication(PermissionAnswer(m_realm.OtherServicePrincipal()), record));
    const auto answer = acceptor.Step(record.Token());
    ASSERT_EQ(answer.outcome, Outcome::Failed);
    EXPECT_THAT(answer.error, testing::HasSubstr("minor"));
    EXPECT_TRUE(acceptor.ClientName().empty());
    // The acceptor's error token tells the client why.
    ASSERT_FALSE(answer.token.empty());
    EXPECT_THAT(ErrorOf([&] { client->ContinueAuthentication(StepAnswer(3, answer.token), record); }),
                MatchesRegex(AuthenticationFailed("WRONG_PRINCIPAL")));
}

TEST_F(KerberosLogOn, ServerSkippingMutualAuthenticationIsCaught)
{
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    CAuthenticationRequestTransferData record;
    ASSERT_TRUE(client->StartAuthentication(PermissionAnswer(m_realm.ServicePrincipal()), record));
    // Status 1 without the server's token: complete for the server, not for us.
    EXPECT_THAT(ErrorOf([&] { client->ContinueAuthentication(StepAnswer(1, {}), record); }),
                MatchesRegex(kNoMutualAuthentication));
}

TEST_F(KerberosLogOn, ForgedOrMalformedServerAnswersAreInvalidTokens)
{
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    CAuthenticationRequestTransferData record;
    ASSERT_TRUE(client->StartAuthentication(PermissionAnswer(m_realm.ServicePrincipal()), record));
    const ByteBuffer truncated(StepAnswer(3, {1, 2, 3}).data(), 26);
    EXPECT_THAT(ErrorOf([&] { client->ContinueAuthentication(truncated, record); }),
                MatchesRegex(AuthenticationFailed("INVALID_TOKEN")));
    EXPECT_THAT(ErrorOf([&] { client->ContinueAuthentication(StepAnswer(3, {0x6f, 0x03, 0x01, 0x02, 0x03}), record); }),
                MatchesRegex(AuthenticationFailed("INVALID_TOKEN")));
    const std::vector<std::uint8_t> oversized(CKerberosClient::kMaxTokenSize + 1, 0x60);
    EXPECT_THAT(ErrorOf([&] { client->ContinueAuthentication(StepAnswer(3, oversized), record); }),
                MatchesRegex(AuthenticationFailed("INVALID_TOKEN")));
}

TEST_F(KerberosLogOn, TicketWithoutDelegationIsRefusedByTheAcceptor)
{
    m_realm.Kinit(m_realm.UserPrincipal(), m_realm.UserPassword(), false);
    ClientPtr<CKerberosClient> client(new CKerberosClient);
    KerberosAcceptor acceptor = Acceptor();
    CAuthenticationRequestTransferData record;
    ASSERT_TRUE(client->StartAuthentication(PermissionAnswer(m_realm.ServicePrincipal()), record));
    const auto answer = acceptor.Step(record.Token());
    EXPECT_EQ(answer.outcome, Outcome::Failed);
    EXPECT_THAT(answer.error, testing::HasSubstr("delegation"));
    EXPECT_TRUE(acceptor.ClientName().empty());
}

TEST(KerberosClientSID, PresentsTheSidOnceAsUtf16LittleEndian)
{
    ClientPtr<CKerberosClientSID> client(new CKerberosClientSID(u"S-1-5-\u00e9"));
    CAuthenticationRequestTransferData record;
    EXPECT_TRUE(client->StartAuthentication(ByteBuffer(), record));
    EXPECT_EQ(record.Token(), (std::vector<std::uint8_t>{'S', 0, '-', 0, '1', 0, '-', 0, '5', 0, '-', 0, 0xe9, 0}));
    EXPECT_FALSE(client->ContinueAuthentication(ByteBuffer(), record));
}

TEST(KerberosClientSID, EmptySidIsRefused)
{
    try {
        CKerberosClientSID client(u"");
        FAIL() << "an empty SID was taken";
    } catch (const DataCache::ToIntMsgDa &error) {
        EXPECT_EQ(error.Code(), 181u);
        EXPECT_THAT(ToUtf8(error.Message()),
                    MatchesRegex("^KerberosClientSID\\([0-9]+\\): ERROR\\(181\\): KerberosClientSID Error: SID empty$"));
    }
}

TEST(KerberosClientSID, UserNameIsTheLocalAccountOfTheSid)
{
    const passwd *entry = ::getpwuid(::getuid());
    ASSERT_NE(entry, nullptr);
    ClientPtr<CKerberosClientSID> client(new CKerberosClientSID(u"S-1-22-1-" + cv::krn::ToUtf16(std::to_string(::getuid()))));
    EXPECT_EQ(ToUtf8(client->GetUserName()), entry->pw_name);
    ClientPtr<CKerberosClientSID> foreign(new CKerberosClientSID(u"S-1-5-21-1-2-3-500"));
    EXPECT_EQ(foreign->GetUserName(), u"");
}

} // namespace
