#include "protocolfixture.h"

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/clientproof.h"
#include "dunemere/ikerberosclient.h"
#include "dunemere/requestidentifier.h"
#include "dunemere/requestorbase.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/tointmsgda.h"
#include "sorvik/packedversion.h"
#include "support/scriptedserver.h"
#include "support/signal.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <optional>
#include <vector>

namespace {

using cv::vek::rovo::RequestorBase;
using cv::vek::rovo::tRequestTransferData;
using cv::vek::rovo::tResponseTransferData;
using sorvik::PackVersion;
using testsupport::ScriptedServer;
using testsupport::Signal;
using namespace std::chrono_literals;
using ::testing::HasSubstr;

[[maybe_unused]] const bool g_registry = (testsupport::InstallCommRegistry(), true);

constexpr std::uint32_t k18 = PackVersion(18, 0, 0);

std::string Utf8(const std::u16string &text)
{
    return std::string(text.begin(), text.end());
}

// Runs call and returns the protocol error it raised.
template <typename Call>
DataCache::ToIntMsgDa ErrorOf(Call &&call)
{
    try {
        call();
    } catch (const DataCache::ToIntMsgDa &error) {
        return error;
    }
    ADD_FAILURE() << "no protocol error raised";
    return DataCache::ToIntMsgDa(u"none", 0, 0, u"");
}

std::vector<ScriptedServer::Request> OfKind(const std::vector<ScriptedServer::Request> &all, std::uint32_t category,
                                            std::uint32_t code)
{
    std::vector<ScriptedServer::Request> found;
    for (const auto &request : all)
        if (request.category == category && request.code == code)
            found.push_back(request);
    return found;
}

class RequestorTest : public testsupport::ProtocolTest
{
protected:
    // The log-on waits for answers as long as the settings say; the request
    // itself waits receiveTimeout when given.
    std::uint32_t Ask(RequestorBase &requestor, std::optional<std::uint32_t> receiveTimeout = {})
    {
        tRequestTransferData request(m_config->GetServerVersion(), 5, 4002);
        return tResponseTransferData(requestor.Exchange(receiveTimeout.value_or(m_config->GetReceiveTimeout()), request))
            .Value();
    }
};

struct Negotiation
{
    std::uint32_t server;
    std::uint32_t laterRequests;
};

class VersionNegotiation : public RequestorTest, public ::testing::WithParamInterface<Negotiation>
{
};

TEST_P(VersionNegotiation, SecondPermissionCarriesTheServersVersionAndLaterRequestsTheStoredOne)
{
    const Negotiation expected = GetParam();
    ScriptedServer server(u"P", ScriptedServer::Serving(expected.server, [](const auto &) { return 7u; }));
    RequestorBase requestor(Settings(), m_log);

    EXPECT_EQ(Ask(requestor), 7u);
    EXPECT_EQ(Ask(requestor), 7u);

    const auto permissions = OfKind(server.Received(), 4, 3001);
    ASSERT_EQ(permissions.size(), 2u);
    EXPECT_EQ(permissions[0].version, k18);
    EXPECT_EQ(permissions[1].version, expected.server);
    const auto requests = OfKind(server.Received(), 5, 4002);
    ASSERT_EQ(requests.size(), 2u);
    EXPECT_EQ(requests[1].version, expected.laterRequests);
    EXPECT_TRUE(Logged(u"SKCP:     Permission request with serverVersion: 18.0.0"));
}

INSTANTIATE_TEST_SUITE_P(Servers, VersionNegotiation,
                         ::testing::Values(Negotiation{PackVersion(17, 0, 0), PackVersion(17, 0, 0)},
                                           Negotiation{PackVersion(19, 0, 0), k18}),
                         [](const ::testing::TestParamInfo<Negotiation> &info) {
                             return "server_" + std::to_string(sorvik::VersionMajor(info.param.server));
                         });

TEST_F(RequestorTest, ServerRefusingBothVersionsIsIncompatible)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        peer.Send(ScriptedServer::Data(request.id, -65535, PackVersion(17, 0, 0)));
    });
    RequestorBase requestor(Settings(), m_log);

    const auto error = ErrorOf([&] { Ask(requestor); });
    EXPECT_EQ(error.Code(), 181u);
    EXPECT_THAT(Utf8(error.Message()),
                ::testing::MatchesRegex("RequestorBase\\([0-9]+\\): ERROR\\(181\\): Error: incompatible server version\\."));
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, PermissionParametersDependOnVersionAndIdentification)
{
    {
        ScriptedServer server(u"P", ScriptedServer::Serving(PackVersion(3, 1, 0), [](const auto &) { return 0u; }));
        RequestorBase requestor(Settings(), m_log);
        Ask(requestor);
        const auto permissions = OfKind(server.Received(), 4, 3001);
        ASSERT_EQ(permissions.size(), 2u);
        EXPECT_EQ(permissions[1].parameters.size(), 0u) << "3.1.0 knows no client proof";
    }
    {
        ScriptedServer server(u"P", ScriptedServer::Serving(PackVersion(3, 1, 1), [](const auto &) { return 0u; }));
        RequestorBase requestor(Settings(u"<clientidentificationstring>tool</clientidentificationstring>"), m_log);
        Ask(requestor);
        const auto permissions = OfKind(server.Received(), 4, 3001);
        ASSERT_EQ(permissions.size(), 2u);
        EXPECT_EQ(permissions[1].parameters, (std::vector<std::u16string>{u"", u""})) << "no key, no proof";
    }
    {
        ScriptedServer server(u"P", ScriptedServer::Serving(k18, [](const auto &) { return 0u; }));
        RequestorBase requestor(Settings(u"<clientidentificationstring>tool</clientidentificationstring>"
                                         u"<clientidentificationsecretkey>s3cret</clientidentificationsecretkey>"),
                                m_log);
        Ask(requestor);
        const auto permission = OfKind(server.Received(), 4, 3001).at(0);
        ASSERT_EQ(permission.parameters.size(), 2u);
        EXPECT_EQ(permission.parameters[0], u"tool");
        EXPECT_EQ(permission.parameters[1], cv::vek::rovo::ComputeClientProof(u"s3cret", u"tool", permission.id));
    }
}

TEST_F(RequestorTest, RefusedLogOnRaisesPermissionDeniedWithTheStatus)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        peer.Send(ScriptedServer::Data(request.id, -13));
    });
    RequestorBase requestor(Settings(), m_log);

    const auto error = ErrorOf([&] { Ask(requestor); });
    EXPECT_EQ(error.Code(), 181u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("): Server Error: Permission denied! Failed with error code -13!"));
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, LateAnswerToAnotherRequestIsSkipped)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 5)
            peer.Send(ScriptedServer::Data(cv::vek::rovo::NewRequestIdentifier(), 0, 1));
        peer.Send(ScriptedServer::Data(request.id, 0, 2));
    });
    RequestorBase requestor(Settings(), m_log);

    EXPECT_EQ(Ask(requestor), 2u);
    EXPECT_TRUE(Logged(u"SKCP:     Got a response from the server"));
}

TEST_F(RequestorTest, ReceiveTimeoutRaises180AndLeavesNoConnection)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 4)
            peer.Send(ScriptedServer::Data(request.id, 0));
    });
    RequestorBase requestor(Settings(), m_log);

    const auto error = ErrorOf([&] { Ask(requestor, 300); });
    EXPECT_EQ(error.Code(), 180u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("): SKCP:     Request timeout. No response."));
    EXPECT_EQ(OfKind(server.Received(), 5, 4002).size(), 1u) << "logged on, and the request went out";
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, AnswersToOtherRequestsCannotHoldTheClientPastItsTimeout)
{
    // The server answers other requests until the client gives up or, far
    // past the client's time-out, the test ends it.
    Signal clientGaveUp;
    ScriptedServer server(u"P", [&](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 4) {
            peer.Send(ScriptedServer::Data(request.id, 0));
            return;
        }
        const auto end = std::chrono::steady_clock::now() + 10s;
        while (std::chrono::steady_clock::now() < end && !clientGaveUp.WaitFor(20ms))
            peer.Send(ScriptedServer::Data(cv::vek::rovo::NewRequestIdentifier(), 0, 1));
    });
    RequestorBase requestor(Settings(), m_log);

    constexpr std::uint32_t timeout = 300;
    const auto started = std::chrono::steady_clock::now();
    const auto error = ErrorOf([&] { Ask(requestor, timeout); });
    const auto waited = std::chrono::steady_clock::now() - started;
    clientGaveUp.Raise();
    EXPECT_EQ(error.Code(), 180u);
    EXPECT_EQ(OfKind(server.Received(), 5, 4002).size(), 1u) << "logged on, and the request went out";
    // Held until the answers stop, the client would wait ten seconds.
    EXPECT_LT(waited, std::chrono::milliseconds(timeout) + 3s);
}

TEST_F(RequestorTest, LostConnectionDuringSendIsMadeAgainWithANewLogOn)
{
    Signal dropped;
    ScriptedServer server(u"P", [&](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 4) {
            peer.Send(ScriptedServer::Data(request.id, 0));
            return;
        }
        peer.Send(ScriptedServer::Data(request.id, 0, std::uint32_t(request.connection)));
        if (request.connection == 1) {
            peer.Drop();
            dropped.Raise();
        }
    });
    RequestorBase requestor(Settings(), m_log);
    EXPECT_EQ(Ask(requestor), 1u);
    ASSERT_TRUE(dropped.WaitFor(10s));

    EXPECT_EQ(Ask(requestor), 2u) << "answered on a second connection";
    EXPECT_EQ(server.Connections(), 2);
    const auto permissions = OfKind(server.Received(), 4, 3001);
    ASSERT_EQ(permissions.size(), 2u);
    EXPECT_EQ(permissions[1].connection, 2) << "logged on again";
    const auto requests = OfKind(server.Received(), 5, 4002);
    ASSERT_EQ(requests.size(), 2u);
    EXPECT_EQ(requests[1].connection, 2);
}

TEST_F(RequestorTest, SendThatCannotFinishRaisesTimeoutDuringSend)
{
    // The server logs the client on and then stops reading, so a large
    // request fills the socket and its send runs out of time.
    Signal resume;
    ScriptedServer server(u"P", [&](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        peer.Send(ScriptedServer::Data(request.id, 0));
        if (request.category == 4)
            resume.WaitFor(20s);
    });
    RequestorBase requestor(Settings(u"<sendtimeout>300</sendtimeout>"), m_log);
    tRequestTransferData request(k18, 2, 1004); // a request that carries a list of identifiers
    const std::vector<GUID> identifiers(200000, cv::vek::rovo::NewRequestIdentifier());
    request.SetIdentifiers(identifiers.data(), std::int32_t(identifiers.size()));

    const auto error = ErrorOf([&] { requestor.Exchange(3000, request); });
    resume.Raise();
    EXPECT_EQ(error.Code(), 180u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("): SKCP:     Timeout during send"));
    EXPECT_EQ(OfKind(server.Received(), 4, 3001).size(), 1u) << "the log-on went through";
}

TEST_F(RequestorTest, LostConnectionDuringSendWithBudgetOneCannotConnect)
{
    Signal dropped;
    ScriptedServer server(u"P", [&](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        peer.Send(ScriptedServer::Data(request.id, 0));
        peer.Drop();
        dropped.Raise();
    });
    RequestorBase requestor(Settings(), m_log);
    requestor.Connect(false, 3);
    ASSERT_TRUE(dropped.WaitFor(10s));

    tRequestTransferData request(k18, 5, 4002);
    cv::krn::ByteBuffer buffer;
    ASSERT_TRUE(request.Serialize(buffer));
    const auto error = ErrorOf([&] { requestor.SendRequest(buffer, 1000, true, 1); });
    EXPECT_EQ(error.Code(), 60u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("): Error: cannot connect to server."));
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, LostLogOnIsRestoredOnceAndTheRequestSentAgainWithANewIdentifier)
{
    int refusals = 1;
    ScriptedServer server(u"P", [&](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 5 && refusals-- > 0)
            peer.Send(ScriptedServer::Data(request.id, -65536));
        else
            peer.Send(ScriptedServer::Data(request.id, 0, 5));
    });
    RequestorBase requestor(Settings(), m_log);

    EXPECT_EQ(Ask(requestor), 5u);
    EXPECT_TRUE(Logged(u"SKCP:     Got a response from the server, but not logged in correctly"));
    EXPECT_EQ(OfKind(server.Received(), 4, 3001).size(), 2u);
    const auto requests = OfKind(server.Received(), 5, 4002);
    ASSERT_EQ(requests.size(), 2u);
    EXPECT_NE(requests[0].id, requests[1].id);

    refusals = 2;
    const auto error = ErrorOf([&] { Ask(requestor); });
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("Failed with error code -65536!")) << "one re-log-on only";
}

TEST_F(RequestorTest, ConnectionLostWhileWaitingForTheAnswer)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 4)
            peer.Send(ScriptedServer::Data(request.id, 0));
        else
            peer.Drop();
    });
    RequestorBase requestor(Settings(), m_log);

    const auto error = ErrorOf([&] { Ask(requestor); });
    EXPECT_EQ(error.Code(), 65u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("): Sorvik is no longer connected."));
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, BareErrorCodeDuringLogOnBecomesPermissionDenied)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        peer.Send(ScriptedServer::Data(request.id, 2, 0, u"svc@localhost"));
    });
    RequestorBase requestor(Settings(), m_log, [](const PLUGIN::IConfig &) -> PLUGIN::IKerberosClient * {
        throw DataCache::cErrCodeDa(77);
    });

    const auto error = ErrorOf([&] { requestor.Connect(false, 3); });
    EXPECT_EQ(error.Code(), 77u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("ERROR(77): Permission denied!"));
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, ShutdownRequestIsNotAnswered)
{
    ScriptedServer server(u"P", ScriptedServer::Serving(k18, [](const auto &) { return 0u; }));
    RequestorBase requestor(Settings(), m_log);
    tRequestTransferData request(k18, 1, 6);

    const auto error = ErrorOf([&] { requestor.Exchange(1000, request); });
    EXPECT_EQ(error.Code(), 43u);
    EXPECT_THAT(Utf8(error.Message()), HasSubstr("): Sorvik is no longer connected."));
}

TEST_F(RequestorTest, MalformedResponseIsAProtocolErrorAndDropsTheConnection)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 4)
            peer.Send(ScriptedServer::Data(request.id, 0));
        else
            peer.Send(cv::krn::ByteBuffer("short", 5));
    });
    RequestorBase requestor(Settings(), m_log);

    const auto error = ErrorOf([&] { Ask(requestor); });
    EXPECT_EQ(error.Code(), 21u);
    EXPECT_FALSE(requestor.IsConnected());
}

TEST_F(RequestorTest, NobodyListeningForAnInstanceCannotConnect)
{
    testsupport::ScopedEnv connectWindow("CORVANE_COMM_CONNECT_WAIT_MS", "0");
    RequestorBase requestor(Settings(), m_log);
    const auto error = ErrorOf([&] { Ask(requestor); });
    EXPECT_EQ(error.Code(), 65u) << "the comm library's error";
    EXPECT_FALSE(requestor.IsConnected());
}

// A log-on client that hands out numbered tokens.
class ScriptedLogOnClient final : public PLUGIN::IKerberosClient
{
public:
    explicit ScriptedLogOnClient(int tokens, int *finalChecks) : m_tokens(tokens), m_finalChecks(finalChecks) {}

    bool StartAuthentication(const cv::krn::ByteBuffer &last, cv::vek::rovo::CAuthenticationRequestTransferData &record) override
    {
        m_target = tResponseTransferData(last).Text();
        return Next(record);
    }
    bool ContinueAuthentication(const cv::krn::ByteBuffer &, cv::vek::rovo::CAuthenticationRequestTransferData &record) override
    {
        if (m_sent == m_tokens) {
            ++*m_finalChecks;
            return false;
        }
        return Next(record);
    }
    std::u16string GetUserName() override { return u"alice@" + m_target; }

private:
    bool Next(cv::vek::rovo::CAuthenticationRequestTransferData &record)
    {
        const std::uint8_t token[] = {std::uint8_t(++m_sent)};
        record.SetToken(token);
        return true;
    }

    int m_tokens;
    int *m_finalChecks;
    int m_sent = 0;
    std::u16string m_target;
};

TEST_F(RequestorTest, AuthenticationContinuesUntilTheServerAnswersLoggedOn)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.code == 3001)
            peer.Send(ScriptedServer::Data(request.id, 2, 0, u"REALM"));
        else if (request.code == 3002)
            peer.Send(ScriptedServer::Authentication(request.id, request.token.at(0) < 3 ? 3 : 1, {9}));
        else
            peer.Send(ScriptedServer::Data(request.id, 0, 11));
    });
    int finalChecks = 0;
    RequestorBase requestor(Settings(), m_log, [&](const PLUGIN::IConfig &) -> PLUGIN::IKerberosClient * {
        return new ScriptedLogOnClient(3, &finalChecks);
    });

    EXPECT_EQ(Ask(requestor), 11u);
    const auto steps = OfKind(server.Received(), 4, 3002);
    ASSERT_EQ(steps.size(), 3u);
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(steps[i].token, std::vector<std::uint8_t>{std::uint8_t(i + 1)});
    EXPECT_EQ(finalChecks, 1) << "the server's last answer is shown to the client";
    EXPECT_TRUE(m_config->IsLoggedIn());
    EXPECT_EQ(m_config->GetUserName(), u"alice@REALM");
    EXPECT_TRUE(Logged(u"SKCP:     Server requires authentication, starting authentication..."));
    EXPECT_TRUE(Logged(u"SKCP:     Continuing authentication..."));
}

TEST_F(RequestorTest, ClientFinishingFirstEndsTheLogOnWithoutSending)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.code == 3001)
            peer.Send(ScriptedServer::Data(request.id, 2, 0, u"REALM"));
        else if (request.code == 3002)
            peer.Send(ScriptedServer::Authentication(request.id, 3, {9}));
        else
            peer.Send(ScriptedServer::Data(request.id, 0, 12));
    });
    int finalChecks = 0;
    RequestorBase requestor(Settings(), m_log, [&](const PLUGIN::IConfig &) -> PLUGIN::IKerberosClient * {
        return new ScriptedLogOnClient(1, &finalChecks);
    });

    EXPECT_EQ(Ask(requestor), 12u);
    EXPECT_EQ(OfKind(server.Received(), 4, 3002).size(), 1u);
    EXPECT_EQ(finalChecks, 1);
    EXPECT_TRUE(m_config->IsLoggedIn());
}

} // namespace
