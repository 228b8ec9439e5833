#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "reference/server/protocolsession.h"
#include "sorvik/packedversion.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <unistd.h>

namespace {

using namespace sorvik::server;
using sorvik::PackVersion;
using cv::krn::ByteBuffer;
using cv::vek::rovo::CAuthenticationRequestTransferData;
using cv::vek::rovo::tRequestTransferData;
using cv::vek::rovo::tResponseTransferAuthentication;
using cv::vek::rovo::tResponseTransferData;

ByteBuffer Bytes(const cv::vek::rovo::CRequestTransferDataBase &request)
{
    ByteBuffer out;
    EXPECT_TRUE(request.Serialize(out));
    return out;
}

class ProtocolSessionTest : public ::testing::Test
{
protected:
    tResponseTransferData Send(const tRequestTransferData &request)
    {
        auto response = m_session.Handle(Bytes(request).bytes());
        EXPECT_TRUE(response.has_value());
        return tResponseTransferData(*response);
    }
    tRequestTransferData Permission(std::uint32_t version = PackVersion(18, 0, 0))
    {
        tRequestTransferData request(version, 4, 3001);
        request.AppendParameter({});
        request.AppendParameter({});
        return request;
    }

    testsupport::TempDir m_dir;
    ServerOptions m_options;
    IndexStatus m_status{QString::fromStdString(m_dir.path().string())};
    std::atomic<std::uint32_t> m_users{0};
    ServerContext m_context{m_options, m_status, m_users, {}};
    ProtocolSession m_session{m_context};
};

TEST_F(ProtocolSessionTest, RequestsBeforeLogOnAreRefusedAndWrongVersionsAnsweredWithTheServers)
{
    EXPECT_EQ(Send(tRequestTransferData(PackVersion(18, 0, 0), 5, 4002)).Status(), kStatusNotLoggedOn);

    const auto refused = Send(Permission(PackVersion(17, 0, 0)));
    EXPECT_EQ(refused.Status(), kStatusIncompatibleVersion);
    EXPECT_EQ(refused.Value(), PackVersion(18, 0, 0));
    EXPECT_FALSE(m_session.IsLoggedOn());

    EXPECT_EQ(Send(Permission()).Status(), kStatusAccepted);
    EXPECT_EQ(m_users.load(), 1u);
    tRequestTransferData count(PackVersion(17, 0, 0), 5, 4002);
    count.Arguments()[2] = 8;
    EXPECT_EQ(Send(count).Status(), kStatusAccepted) << "older requests are served after the log-on";
    EXPECT_EQ(Send(tRequestTransferData(PackVersion(18, 0, 0), 5, 4004)).Status(), kStatusUnknownRequest);
}

TEST_F(ProtocolSessionTest, MalformedRecordsDropTheConnection)
{
    EXPECT_FALSE(m_session.Handle(ByteBuffer("tiny", 4).bytes()));
    ByteBuffer truncated = Bytes(Permission());
    truncated.resize(truncated.size() - 1);
    EXPECT_FALSE(m_session.Handle(truncated.bytes()));
}

TEST_F(ProtocolSessionTest, SidLogOnNeedsAnAccount)
{
    m_options.requireAuthentication = true;
    const auto asked = Send(Permission());
    EXPECT_EQ(asked.Status(), kStatusAuthenticationRequired);

    auto step = [&](const std::u16string &sid) {
        CAuthenticationRequestTransferData request(PackVersion(18, 0, 0));
        std::vector<std::uint8_t> token;
        for (char16_t unit : sid) {
            token.push_back(std::uint8_t(unit));
            token.push_back(std::uint8_t(unit >> 8));
        }
        request.SetToken(token);
        return tResponseTransferAuthentication(*m_session.Handle(Bytes(request).bytes()));
    };
    EXPECT_EQ(step(u"S-1-5-21-1-2-3-4").Status(), kStatusClientRefused);
    EXPECT_FALSE(m_session.IsLoggedOn());

    Send(Permission());
    const std::string uid = std::to_string(::getuid());
    EXPECT_EQ(step(u"S-1-22-1-" + std::u16string(uid.begin(), uid.end())).Status(), kStatusLoggedOn);
    EXPECT_TRUE(m_session.IsLoggedOn());
    EXPECT_FALSE(m_session.ClientName().empty());
}

} // namespace
