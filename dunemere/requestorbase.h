#pragma once

#include "dunemere/iconfig.h"
#include "dunemere/rovocommclient.h"
#include "sorvik/bytebuffer.h"
#include "sorvik/com.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>

namespace cv::util::file::log {
class ILog;
}

namespace PLUGIN {
class IKerberosClient;
}

namespace cv::vek::rovo {

class CAuthenticationRequestTransferData;
class CRequestTransferDataBase;
class tRequestTransferData;

// The client end of the server's request/response protocol: owns the
// connection to one server, logs on (permission, version negotiation, client
// proof, Kerberos), and exchanges one request for the response that carries
// the same request identifier. Every failure is a DataCache::ToIntMsgDa
// (source "RequestorBase"); every retry is bounded by the attempt budget and
// the five-call send and receive loops.
//
// One thread at a time; no locks.
class RequestorBase
{
public:
    static constexpr std::uint32_t kAttemptBudget = 3;
    // Added to a time-out when the local server was started just now.
    static constexpr std::uint32_t kServerStartAllowance = 10000;

    struct Response
    {
        std::int32_t status = 0;
        krn::ByteBuffer buffer;
    };

    // Makes the log-on client for a server that requires authentication:
    // owned through its reference count. Tests replace the default.
    using LogOnClientFactory = std::function<PLUGIN::IKerberosClient *(const PLUGIN::IConfig &config)>;

    RequestorBase(PLUGIN::IConfig &config, util::file::log::ILog &log);
    RequestorBase(PLUGIN::IConfig &config, util::file::log::ILog &log, LogOnClientFactory makeLogOnClient);
    ~RequestorBase();

    RequestorBase(const RequestorBase &) = delete;
    RequestorBase &operator=(const RequestorBase &) = delete;

    // Makes sure a logged-on connection exists; force drops the current one
    // first. With no attempts left the connection is dropped and code 60 raised.
    void Connect(bool force, std::uint32_t attemptsLeft);
    // Starts the local server when it may and does not run; true if started now.
    bool StartServerIfNeeded();
    void LogOn(bool firstAttempt, std::uint32_t attemptsLeft);
    Response RequestPermission(bool firstAttempt, std::uint32_t version, std::uint32_t attemptsLeft);
    void SendRequest(krn::ByteBuffer &buffer, std::uint32_t timeout, bool mayReconnect, std::uint32_t attemptsLeft);
    // Skips responses to other requests; a failure drops the connection.
    Response ReceiveResponse(std::uint32_t receiveTimeout, const GUID &requestId);
    // Sends the request and returns the buffer of its response. A request
    // refused because the log-on was lost is sent once more after a new log-on.
    krn::ByteBuffer Exchange(std::uint32_t receiveTimeout, tRequestTransferData &request);

    // Releases the socket and unloads the comm library.
    void Disconnect() noexcept;
    bool IsConnected() const noexcept { return m_connection != nullptr; }

private:
    comm::ClientSocket &Socket() const;
    std::uint32_t SendWithRetries(krn::ByteBuffer &buffer, std::uint32_t timeout);
    std::uint32_t ReceiveWithRetries(krn::ByteBuffer &buffer, std::uint32_t timeout);
    void OpenConnection(std::uint32_t attemptsLeft);
    void Authenticate(std::uint32_t version, Response &response, std::uint32_t attemptsLeft);
    std::int32_t AuthenticationStep(bool start, PLUGIN::IKerberosClient &client, std::uint32_t version,
                                    Response &response, std::uint32_t attemptsLeft, bool &sentToken);
    std::uint32_t SendTimeoutAllowingStart();

    PLUGIN::IConfig &m_config;
    util::file::log::ILog &m_log;
    LogOnClientFactory m_makeLogOnClient;
    std::unique_ptr<PLUGIN::rovoCommClient> m_connection;
    std::uint32_t m_attemptBudget = kAttemptBudget;
    std::optional<std::chrono::steady_clock::time_point> m_serverStartedAt;
};

} // namespace cv::vek::rovo
