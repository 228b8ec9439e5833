#pragma once

#include "reference/server/indexstatus.h"
#include "reference/server/logonacceptor.h"
#include "reference/server/serveroptions.h"
#include "sorvik/bytebuffer.h"

#include <atomic>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>

namespace cv::vek::rovo {
class CAuthenticationRequestTransferData;
class tRequestTransferData;
}

namespace sorvik::server {

// Statuses the server answers with.
inline constexpr std::int32_t kStatusAccepted = 0;
inline constexpr std::int32_t kStatusLoggedOn = 1;
inline constexpr std::int32_t kStatusAuthenticationRequired = 2;
inline constexpr std::int32_t kStatusAuthenticationContinues = 3;
inline constexpr std::int32_t kStatusClientRefused = -13; // wrong identification or proof, failed log-on
inline constexpr std::int32_t kStatusUnknownRequest = -22;
inline constexpr std::int32_t kStatusServerFailure = -500; // its status store failed
inline constexpr std::int32_t kStatusIncompatibleVersion = -65535;
inline constexpr std::int32_t kStatusNotLoggedOn = -65536;

// What the connections of one server share.
struct ServerContext
{
    const ServerOptions &options;
    IndexStatus &status;
    std::atomic<std::uint32_t> &loggedOnUsers;
    // Makes a Kerberos acceptor; empty when the server has no keytab.
    std::function<std::unique_ptr<ILogOnAcceptor>()> makeKerberosAcceptor;
    // Told the name of each client that logs on (empty without log-on client).
    std::function<void(const std::u16string &clientName)> onLoggedOn = {};
};

// The protocol state of one client connection: log-on, then requests. It
// does no input or output; it is handed each received record and hands back
// the response.
class ProtocolSession
{
public:
    explicit ProtocolSession(ServerContext &context);
    ~ProtocolSession();

    ProtocolSession(const ProtocolSession &) = delete;
    ProtocolSession &operator=(const ProtocolSession &) = delete;

    // The response to send; nothing when the record is malformed and the
    // connection is to be dropped.
    std::optional<cv::krn::ByteBuffer> Handle(std::span<const std::uint8_t> record);

    bool IsLoggedOn() const noexcept { return m_loggedOn; }
    const std::u16string &ClientName() const noexcept { return m_clientName; }

private:
    cv::krn::ByteBuffer Permission(const cv::vek::rovo::tRequestTransferData &request);
    cv::krn::ByteBuffer Authentication(const cv::vek::rovo::CAuthenticationRequestTransferData &request);
    cv::krn::ByteBuffer StatisticsOrFailure(const cv::vek::rovo::tRequestTransferData &request);
    cv::krn::ByteBuffer Statistics(const cv::vek::rovo::tRequestTransferData &request);
    bool ClientProofValid(const cv::vek::rovo::tRequestTransferData &request) const;
    void SetLoggedOn(std::u16string clientName);

    ServerContext &m_context;
    bool m_loggedOn = false;
    bool m_awaitingAuthentication = false;
    std::u16string m_clientName;
    std::unique_ptr<ILogOnAcceptor> m_acceptor;
};

} // namespace sorvik::server
