#include "dunemere/requestorbase.h"

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/clientproof.h"
#include "dunemere/ikerberosclient.h"
#include "dunemere/instancenames.h"
#include "dunemere/logonclient.h"
#include "dunemere/requestidentifier.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/tointmsgda.h"
#include "krn/exception/exception.h"
#include "krn/osdep/mutex.h"
#include "krn/osdep/process.h"
#include "krn/utf.h"
#include "log/ilog.h"
#include "sorvik/packedversion.h"

#include <chrono>
#include <string>
#include <thread>

namespace cv::vek::rovo {

namespace {

constexpr std::u16string_view kSource = u"RequestorBase";
constexpr std::uint32_t kVerbosity = 5;
constexpr std::uint32_t kStartVerbosity = 2;
constexpr int kCallsPerTransfer = 5;

constexpr std::int32_t kStatusLoggedOn = 1;
constexpr std::int32_t kStatusAuthenticationRequired = 2;
constexpr std::int32_t kStatusAuthenticationContinues = 3;
constexpr std::int32_t kStatusIncompatibleVersion = -65535;
constexpr std::int32_t kStatusNotLoggedOn = -65536;

constexpr std::uint32_t kPermissionCategory = 4;
constexpr std::uint32_t kPermissionCode = 3001;
constexpr std::uint32_t kAuthenticationCode = 3002;

using comm::kResultConnectionLost;
using comm::kResultOk;
using comm::kResultTimeout;

std::u16string Decimal(std::int64_t value)
{
    const std::string digits = std::to_string(value);
    return std::u16string(digits.begin(), digits.end());
}

[[noreturn]] void RaisePermissionDenied(std::int32_t status, std::uint32_t line = __builtin_LINE())
{
    throw DataCache::ToIntMsgDa(kSource, line, 181,
                                u"Server Error: Permission denied! Failed with error code " + Decimal(status) + u"!");
}

[[noreturn]] void RaiseSendFailed(std::uint32_t line = __builtin_LINE())
{
    throw DataCache::ToIntMsgDa(kSource, line, 180, u"SKCP:     Timeout during send");
}

// A record that does not decode cannot be trusted, nor can the stream it came
// on; the protocol error keeps the failure inside the client's error model.
[[noreturn]] void RaiseMalformedResponse(std::uint32_t line = __builtin_LINE())
{
    throw DataCache::ToIntMsgDa(kSource, line, 21, u"Error: malformed response from the server.");
}

std::uint32_t ServerVersionOf(const krn::ByteBuffer &response)
{
    try {
        return tResponseTransferData(response).Value();
    } catch (const krn::exception::Exception &) {
        RaiseMalformedResponse();
    }
}

bool StopsSend(std::uint32_t result)
{
    return result == kResultOk || result == kResultTimeout || result == kResultConnectionLost || result < 0x80000000u;
}

bool StopsReceive(std::uint32_t result)
{
    return result < 0x80000000u || result == kResultTimeout;
}

// A transfer that failed gives the peer a moment before the next try. One
// that is done yields nothing: on Linux a yield is a system call that, on a
// busy machine, hands the rest of the time slice to whoever waits, which
// cost more than the whole exchange.
void YieldBeforeRetry()
{
    std::this_thread::yield();
}

// Releases the log-on client's reference when the log-on ends, however it ends.
struct LogOnClientReference
{
    PLUGIN::IKerberosClient *client;
    ~LogOnClientReference()
    {
        if (client)
            client->Release();
    }
};

} // namespace

RequestorBase::RequestorBase(PLUGIN::IConfig &config, util::file::log::ILog &log)
    : RequestorBase(config, log, &PLUGIN::CreateLogOnClient)
{
}

RequestorBase::RequestorBase(PLUGIN::IConfig &config, util::file::log::ILog &log, LogOnClientFactory makeLogOnClient)
    : m_config(config), m_log(log), m_makeLogOnClient(std::move(makeLogOnClient))
{
}

RequestorBase::~RequestorBase()
{
    Disconnect();
}

void RequestorBase::Disconnect() noexcept
{
    m_connection.reset();
}

comm::ClientSocket &RequestorBase::Socket() const
{
    return m_connection->Socket();
}

void RequestorBase::Connect(bool force, std::uint32_t attemptsLeft)
{
    if (attemptsLeft == 0) {
        Disconnect();
        throw DataCache::ToIntMsgDa(kSource, 60, u"Error: cannot connect to server.");
    }
    if (force)
        Disconnect();
    if (m_connection)
        return;
    try {
        OpenConnection(attemptsLeft);
    } catch (const DataCache::ToIntMsgDa &) {
        Disconnect();
        throw;
    } catch (DataCache::cErrCodeDa code) {
        Disconnect();
        throw DataCache::ToIntMsgDa(kSource, std::uint32_t(code), u"Permission denied!");
    }
}

void RequestorBase::OpenConnection(std::uint32_t attemptsLeft)
{
    std::uint32_t timeout = m_config.GetSendTimeout();
    if (StartServerIfNeeded())
        timeout += kServerStartAllowance;

    const std::u16string &portName = m_config.GetPortName();
    const krn::WString serviceClass(portName.empty() ? u"VEK_INDEX_SERVICE_SEARCH_BROWSE" : u"VEK_INDEX_SERVICE_SERVER");
    const krn::WString serviceName(portName.empty() ? std::u16string_view(u"VEK_INDEX_SERVICE")
                                                    : std::u16string_view(portName));
    m_connection = PLUGIN::rovoCommClient::Create(krn::WString(m_config.GetServer()), serviceName, serviceClass);
    Socket().SetTimeout(timeout);
    LogOn(true, attemptsLeft);
}

bool RequestorBase::StartServerIfNeeded()
{
    if (!m_config.CanStartEngine())
        return false;
    // A server started moments ago may not hold its mutex yet; starting a
    // second one would only make it give up at once.
    if (m_serverStartedAt && std::chrono::steady_clock::now() - *m_serverStartedAt <
                                 std::chrono::milliseconds(kServerStartAllowance))
        return false;
    try {
        auto mutex = dunemere::OpenGlobalServerMutex();
        if (!mutex->TryAcquire())
            return false;
        mutex->Release();
    } catch (const krn::exception::Exception &) {
        // Without the mutex nobody can tell; trying to start costs little.
    }

    m_log.Info(__FILE__, __LINE__, kStartVerbosity) << "SKCP:     Sorvik is not running so we try to start it!";
    if (!krn::osdep::StartDetachedProcess(krn::ToUtf8(dunemere::ServerExecutablePath()),
                                           dunemere::StartedServerLogPath()))
        throw DataCache::ToIntMsgDa(kSource, 65,
                                    u"PLUGIN: Sorvik is not running and the plugin is not able to start it!");
    m_serverStartedAt = std::chrono::steady_clock::now();
    return true;
}

std::uint32_t RequestorBase::SendTimeoutAllowingStart()
{
    std::uint32_t timeout = m_config.GetSendTimeout();
    if (StartServerIfNeeded())
        timeout += kServerStartAllowance;
    return timeout;
}

RequestorBase::Response RequestorBase::RequestPermission(bool firstAttempt, std::uint32_t version,
                                                         std::uint32_t attemptsLeft)
{
    m_log.Info(__FILE__, __LINE__, kVerbosity)
        << "SKCP:     Permission request with serverVersion: " << sorvik::VersionMajor(version) << '.'
        << sorvik::VersionMinor(version) << '.' << sorvik::VersionPatch(version);

    tRequestTransferData request(version, kPermissionCategory, kPermissionCode);
    AddPermissionParameters(request, m_config.GetClientIdentificationString(),
                            m_config.GetClientIdentificationSecretKey());

    std::uint32_t timeout = m_config.GetSendTimeout();
    if (firstAttempt && attemptsLeft == m_attemptBudget && StartServerIfNeeded())
        timeout += kServerStartAllowance;

    krn::ByteBuffer buffer;
    if (!request.Serialize(buffer))
        RaiseSendFailed();
    SendRequest(buffer, timeout, firstAttempt, attemptsLeft);
    return ReceiveResponse(m_config.GetReceiveTimeout(), request.RequestIdentifier());
}

void RequestorBase::LogOn(bool firstAttempt, std::uint32_t attemptsLeft)
{
    std::uint32_t version = m_config.GetServerVersion();
    Response response = RequestPermission(firstAttempt, version, attemptsLeft);
    if (response.status == kStatusIncompatibleVersion) {
        version = ServerVersionOf(response.buffer);
        m_config.SetServerVersion(version);
        response = RequestPermission(firstAttempt, version, attemptsLeft);
        if (response.status == kStatusIncompatibleVersion)
            throw DataCache::ToIntMsgDa(kSource, 181, u"Error: incompatible server version.");
    }
    if (response.status == kStatusAuthenticationRequired)
        Authenticate(version, response, attemptsLeft);
    if (response.status < 0)
        RaisePermissionDenied(response.status);
}

void RequestorBase::Authenticate(std::uint32_t version, Response &response, std::uint32_t attemptsLeft)
{
    LogOnClientReference client{m_makeLogOnClient(m_config)};
    bool sentToken = false;
    response.status = AuthenticationStep(true, *client.client, version, response, attemptsLeft, sentToken);
    while (response.status == kStatusAuthenticationContinues)
        response.status = AuthenticationStep(false, *client.client, version, response, attemptsLeft, sentToken);
    if (response.status != kStatusLoggedOn)
        return;
    // The server ended the exchange right after a token of ours. Its final
    // answer may carry its own proof of identity, which the client must still
    // check: a server that skips it has not authenticated itself.
    if (sentToken) {
        CAuthenticationRequestTransferData unused(version, kPermissionCategory, kAuthenticationCode);
        if (client.client->ContinueAuthentication(response.buffer, unused))
            throw DataCache::ToIntMsgDa(kSource, 181, u"KerberosClient Error: no mutual authentication.");
    }
    m_config.SetLoggedIn(true, client.client->GetUserName());
}

std::int32_t RequestorBase::AuthenticationStep(bool start, PLUGIN::IKerberosClient &client, std::uint32_t version,
                                               Response &response, std::uint32_t attemptsLeft, bool &sentToken)
{
    m_log.Info(__FILE__, __LINE__, kVerbosity)
        << (start ? "SKCP:     Server requires authentication, starting authentication..."
                  : "SKCP:     Continuing authentication...");

    CAuthenticationRequestTransferData record(version, kPermissionCategory, kAuthenticationCode);
    const bool mustSend = start ? client.StartAuthentication(response.buffer, record)
                                : client.ContinueAuthentication(response.buffer, record);
    sentToken = mustSend;
    if (!mustSend)
        return kStatusLoggedOn;

    krn::ByteBuffer buffer;
    if (!record.Serialize(buffer))
        RaiseSendFailed();
    const std::uint32_t timeout = m_config.GetSendTimeout();
    Connect(false, attemptsLeft);
    if (SendWithRetries(buffer, timeout) != kResultOk)
        RaiseSendFailed();
    response = ReceiveResponse(m_config.GetReceiveTimeout(), record.RequestIdentifier());
    return response.status;
}

void RequestorBase::SendRequest(krn::ByteBuffer &buffer, std::uint32_t timeout, bool mayReconnect,
                                std::uint32_t attemptsLeft)
{
    Connect(false, attemptsLeft);
    const std::uint32_t result = SendWithRetries(buffer, timeout);
    if (result == kResultOk)
        return;
    if (mayReconnect && result == kResultConnectionLost) {
        Connect(true, attemptsLeft - 1);
        if (SendWithRetries(buffer, m_config.GetSendTimeout()) == kResultOk)
            return;
    }
    RaiseSendFailed();
}

RequestorBase::Response RequestorBase::ReceiveResponse(std::uint32_t receiveTimeout, const GUID &requestId)
{
    using Clock = std::chrono::steady_clock;
    const bool unlimited = receiveTimeout == comm::kInfinite;
    const auto deadline = Clock::now() + std::chrono::milliseconds(unlimited ? 0 : receiveTimeout);

    Response response;
    std::uint32_t timeout = receiveTimeout;
    for (;;) {
        response.buffer.clear();
        const std::uint32_t result = ReceiveWithRetries(response.buffer, timeout);
        if (result != kResultOk) {
            Disconnect();
            if (result == kResultTimeout)
                throw DataCache::ToIntMsgDa(kSource, 180, u"SKCP:     Request timeout. No response.");
            if (result == kResultConnectionLost)
                throw DataCache::ToIntMsgDa(kSource, 65, u"Sorvik is no longer connected.");
            throw DataCache::ToIntMsgDa(kSource, 21,
                                        u"Error(" + Decimal(std::int32_t(result)) + u") occurred during receive.");
        }

        std::optional<tResponseTransferDataBase> header;
        try {
            header.emplace(response.buffer);
        } catch (const krn::exception::Exception &) {
            Disconnect();
            RaiseMalformedResponse();
        }
        if (header->RequestIdentifier() == requestId) {
            response.status = header->Status();
            return response;
        }
        // A late answer to an earlier request. The wait for the right one
        // stays bounded by the time-out it started with, so a server that
        // keeps answering other requests cannot hold the client forever.
        if (!unlimited) {
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
            timeout = std::uint32_t(std::max<std::int64_t>(left, 1));
        }
    }
}

krn::ByteBuffer RequestorBase::Exchange(std::uint32_t receiveTimeout, tRequestTransferData &request)
{
    krn::ByteBuffer buffer;
    const std::uint32_t timeout = SendTimeoutAllowingStart();
    if (!request.Serialize(buffer))
        RaiseSendFailed();
    SendRequest(buffer, timeout, true, kAttemptBudget);
    if (request.Category() == 1 && request.Code() == 6)
        throw DataCache::ToIntMsgDa(kSource, 43, u"Sorvik is no longer connected.");

    Response response = ReceiveResponse(receiveTimeout, request.RequestIdentifier());
    if (response.status == kStatusNotLoggedOn) {
        m_log.Info(__FILE__, __LINE__, kVerbosity)
            << "SKCP:     Got a response from the server, but not logged in correctly";
        LogOn(false, kAttemptBudget);
        request.RenewRequestIdentifier();
        buffer.clear();
        if (!request.Serialize(buffer))
            RaiseSendFailed();
        Connect(false, kAttemptBudget);
        if (SendWithRetries(buffer, m_config.GetSendTimeout()) != kResultOk)
            RaiseSendFailed();
        response = ReceiveResponse(receiveTimeout, request.RequestIdentifier());
    }
    if (response.status < 0)
        RaisePermissionDenied(response.status);
    m_log.Info(__FILE__, __LINE__, kVerbosity) << "SKCP:     Got a response from the server";
    return std::move(response.buffer);
}

std::uint32_t RequestorBase::SendWithRetries(krn::ByteBuffer &buffer, std::uint32_t timeout)
{
    std::uint32_t result = comm::kResultFailure;
    for (int call = 0; call < kCallsPerTransfer; ++call) {
        if (call > 0)
            YieldBeforeRetry();
        result = Socket().Send(buffer, timeout);
        if (StopsSend(result))
            break;
    }
    return result;
}

std::uint32_t RequestorBase::ReceiveWithRetries(krn::ByteBuffer &buffer, std::uint32_t timeout)
{
    std::uint32_t result = comm::kResultFailure;
    for (int call = 0; call < kCallsPerTransfer; ++call) {
        if (call > 0)
            YieldBeforeRetry();
        result = Socket().Receive(buffer, timeout);
        if (StopsReceive(result))
            break;
    }
    return result;
}

} // namespace cv::vek::rovo
