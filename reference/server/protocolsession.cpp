#include "reference/server/protocolsession.h"

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/clientproof.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "krn/exception/exception.h"
#include "reference/kerberosaccept/sidlogon.h"
#include "reference/libsupport/refobject.h"
#include "sorvik/packedversion.h"
#include "sorvik/vekexception.h"

#include <cstring>

namespace sorvik::server {

namespace {

using cv::krn::ByteBuffer;
using cv::vek::rovo::CAuthenticationRequestTransferData;
using cv::vek::rovo::CRequestTransferDataBase;
using cv::vek::rovo::tRequestTransferData;
using cv::vek::rovo::tResponseTransferAuthentication;
using cv::vek::rovo::tResponseTransferData;

constexpr std::uint32_t kLogOnCategory = 4;
constexpr std::uint32_t kPermissionCode = 3001;
constexpr std::uint32_t kAuthenticationCode = 3002;
constexpr std::uint32_t kStatisticsCategory = 5;
constexpr std::uint32_t kClientProofVersion = PackVersion(3, 1, 1);

ByteBuffer DataResponse(const GUID &requestId, std::int32_t status, std::uint32_t value = 0,
                        std::u16string text = {})
{
    ByteBuffer out;
    if (!tResponseTransferData(requestId, status, value, std::move(text)).Serialize(out))
        throw std::bad_alloc();
    return out;
}

ByteBuffer AuthenticationResponse(const GUID &requestId, std::int32_t status, std::span<const std::uint8_t> token)
{
    ByteBuffer out;
    if (!tResponseTransferAuthentication(requestId, status, token).Serialize(out))
        throw std::bad_alloc();
    return out;
}

std::uint32_t Word(const std::uint8_t *bytes)
{
    return std::uint32_t(bytes[0]) | std::uint32_t(bytes[1]) << 8 | std::uint32_t(bytes[2]) << 16 |
           std::uint32_t(bytes[3]) << 24;
}

// A SID log-on presents "S-…" as UTF-16LE; a Kerberos token never starts so.
bool LooksLikeSid(std::span<const std::uint8_t> token)
{
    return token.size() >= 4 && token[0] == 'S' && token[1] == 0 && token[2] == '-' && token[3] == 0;
}

} // namespace

ProtocolSession::ProtocolSession(ServerContext &context) : m_context(context) {}

ProtocolSession::~ProtocolSession()
{
    if (m_loggedOn)
        --m_context.loggedOnUsers;
}

std::optional<ByteBuffer> ProtocolSession::Handle(std::span<const std::uint8_t> record)
{
    if (record.size() < CRequestTransferDataBase::kHeaderSize)
        return std::nullopt;
    const std::uint32_t category = Word(record.data() + 12);
    const std::uint32_t code = Word(record.data() + 16);
    try {
        std::size_t position = 0;
        if (category == kLogOnCategory && code == kAuthenticationCode) {
            CAuthenticationRequestTransferData request;
            request.Deserialize(record, position);
            return Authentication(request);
        }
        tRequestTransferData request;
        request.Deserialize(record, position);
        if (category == kLogOnCategory && code == kPermissionCode)
            return Permission(request);
        if (!m_loggedOn)
            return DataResponse(request.RequestIdentifier(), kStatusNotLoggedOn);
        if (category == kStatisticsCategory)
            return StatisticsOrFailure(request);
        return DataResponse(request.RequestIdentifier(), kStatusUnknownRequest);
    } catch (const cv::krn::exception::Exception &) {
        return std::nullopt;
    } catch (const cv::vek::Exception &) {
        return std::nullopt;
    }
}

bool ProtocolSession::ClientProofValid(const tRequestTransferData &request) const
{
    const ServerOptions &options = m_context.options;
    if (request.Version() < kClientProofVersion || request.ParameterCount() < 2)
        return false;
    const std::u16string expected =
        cv::vek::rovo::ComputeClientProof(options.secretKey, options.identification, request.RequestIdentifier());
    return request.Parameter(0) == options.identification && !expected.empty() && request.Parameter(1) == expected;
}

void ProtocolSession::SetLoggedOn(std::u16string clientName)
{
    if (m_context.onLoggedOn)
        m_context.onLoggedOn(clientName);
    m_awaitingAuthentication = false;
    m_acceptor.reset();
    m_clientName = std::move(clientName);
    if (!m_loggedOn)
        ++m_context.loggedOnUsers;
    m_loggedOn = true;
}

ByteBuffer ProtocolSession::Permission(const tRequestTransferData &request)
{
    const ServerOptions &options = m_context.options;
    const GUID &id = request.RequestIdentifier();
    if (request.Version() != options.version)
        return DataResponse(id, kStatusIncompatibleVersion, options.version);
    if (options.ChecksClientProof() && !ClientProofValid(request))
        return DataResponse(id, kStatusClientRefused);
    if (options.RequiresAuthentication()) {
        m_awaitingAuthentication = true;
        m_acceptor.reset();
        return DataResponse(id, kStatusAuthenticationRequired, 0,
                            options.clientTarget.empty() ? options.principal : options.clientTarget);
    }
    SetLoggedOn({});
    return DataResponse(id, kStatusAccepted);
}

ByteBuffer ProtocolSession::Authentication(const CAuthenticationRequestTransferData &request)
{
    const GUID &id = request.RequestIdentifier();
    if (!m_awaitingAuthentication)
        return AuthenticationResponse(id, kStatusClientRefused, {});

    if (!m_acceptor) {
        if (LooksLikeSid(request.Token())) {
            const auto logOn = cv::vek::rovo::kerberos::AcceptSidLogOn(request.Token());
            if (!logOn.accepted)
                return AuthenticationResponse(id, kStatusClientRefused, {});
            SetLoggedOn(logOn.account);
            return AuthenticationResponse(id, kStatusLoggedOn, {});
        }
        if (!m_context.makeKerberosAcceptor)
            return AuthenticationResponse(id, kStatusClientRefused, {});
        m_acceptor = m_context.makeKerberosAcceptor();
    }

    ILogOnAcceptor::Step step = m_acceptor->Accept(request.Token());
    switch (step.kind) {
    case ILogOnAcceptor::Step::Kind::Continue:
        return AuthenticationResponse(id, kStatusAuthenticationContinues, step.token);
    case ILogOnAcceptor::Step::Kind::Complete:
        SetLoggedOn(std::move(step.clientName));
        if (m_context.options.skipMutualAuthentication)
            step.token.clear();
        return AuthenticationResponse(id, kStatusLoggedOn, step.token);
    case ILogOnAcceptor::Step::Kind::Failed:
        break;
    }
    m_awaitingAuthentication = false;
    m_acceptor.reset();
    // An error token tells the client what went wrong; its next step fails
    // on it, and anything it sends after that is refused.
    if (!step.token.empty())
        return AuthenticationResponse(id, kStatusAuthenticationContinues, step.token);
    return AuthenticationResponse(id, kStatusClientRefused, {});
}

ByteBuffer ProtocolSession::StatisticsOrFailure(const tRequestTransferData &request)
{
    try {
        return Statistics(request);
    } catch (const ref::Failure &) {
        return DataResponse(request.RequestIdentifier(), kStatusServerFailure);
    }
}

ByteBuffer ProtocolSession::Statistics(const tRequestTransferData &request)
{
    IndexStatus &status = m_context.status;
    const GUID &id = request.RequestIdentifier();
    const auto &words = request.Arguments();
    switch (request.Code()) {
    case 4001:
        return DataResponse(id, kStatusAccepted, m_context.loggedOnUsers.load());
    case 4002:
        return DataResponse(id, kStatusAccepted, status.ElementCount(words[2]));
    case 4003:
        return DataResponse(id, kStatusAccepted, status.DiskIsFullCrawlStop() ? 1 : 0);
    case 4005:
        return DataResponse(id, kStatusAccepted, status.FileviewsTimeouted());
    case 4006: {
        auto perParselet = status.FileviewsTimeoutedPerParselet();
        return DataResponse(id, kStatusAccepted, perParselet.entries, std::move(perParselet.text));
    }
    case 4007:
        status.ResetTimeouted();
        return DataResponse(id, kStatusAccepted);
    case 4008:
        status.ResetFailure();
        return DataResponse(id, kStatusAccepted);
    case 4009:
        status.ResetNotMyFile();
        return DataResponse(id, kStatusAccepted);
    default:
        return DataResponse(id, kStatusUnknownRequest);
    }
}

} // namespace sorvik::server
