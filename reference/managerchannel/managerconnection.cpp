#include "reference/managerchannel/managerconnection.h"

#include "reference/comm/deadline.h"
#include "reference/comm/endpoint.h"
#include "reference/comm/peertrust.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>
#include <unistd.h>

namespace sorvik::manager {

namespace comm = cv::vek::rovo::comm;

std::filesystem::path SocketPath(std::u16string_view portName)
{
    std::filesystem::path path;
    const bool local = portName.empty();
    if (comm::LocalSocketPath(local ? kLocalName : portName, local ? kLocalClass : kInstanceClass, path) !=
        comm::kResultOk)
        return {};
    return path;
}

std::unique_ptr<ManagerConnection> ManagerConnection::Open(std::u16string_view portName, std::uint32_t timeoutMs,
                                                           int &error)
{
    const std::filesystem::path path = SocketPath(portName);
    if (path.empty()) {
        error = EINVAL;
        return nullptr;
    }
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, path.c_str(), path.native().size() + 1);

    const int fd = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0) {
        error = errno;
        return nullptr;
    }
    // A blocking connect to a local socket waits only while the server's
    // queue of new connections is full; the send time-out bounds that wait.
    // (A zero time-out would mean none at all.)
    const std::uint32_t bound = std::max<std::uint32_t>(timeoutMs, 1);
    const timeval limit{time_t(bound / 1000), suseconds_t(bound % 1000 * 1000)};
    ::setsockopt(fd, SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit);
    int result;
    do {
        result = ::connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address);
    } while (result != 0 && errno == EINTR);
    if (result != 0) {
        error = errno == EINPROGRESS ? EAGAIN : errno;
        ::close(fd);
        return nullptr;
    }
    // A socket another user could have put there is nobody's to trust.
    std::string untrusted;
    if (comm::CheckLocalServer(path, fd, untrusted) != comm::kResultOk) {
        error = EACCES;
        ::close(fd);
        return nullptr;
    }
    const timeval none{};
    ::setsockopt(fd, SOL_SOCKET, SO_SNDTIMEO, &none, sizeof none);
    error = 0;
    return std::make_unique<ManagerConnection>(fd);
}

ManagerConnection::Result ManagerConnection::Call(const QJsonObject &request, QJsonObject &answer,
                                                  std::uint32_t timeoutMs)
{
    const comm::Deadline deadline(timeoutMs);
    const cv::krn::ByteBuffer record = EncodeMessage(request);
    auto remaining = [&] { return std::uint32_t(std::max(deadline.RemainingMs(), 0)); };
    const std::uint32_t sent = m_socket.Send(record.bytes(), timeoutMs == comm::kInfinite ? timeoutMs : remaining());
    if (sent == comm::kResultTimeout)
        return Result::TimedOut;
    if (sent != comm::kResultOk)
        return Result::Lost;

    cv::krn::ByteBuffer received;
    const std::uint32_t got = m_socket.Receive(received, timeoutMs == comm::kInfinite ? timeoutMs : remaining());
    if (got == comm::kResultTimeout)
        return Result::TimedOut;
    if (got != comm::kResultOk)
        return Result::Lost;
    auto message = DecodeMessage(received.bytes(), kMaxAnswerBytes);
    if (!message)
        return Result::Malformed;
    answer = std::move(*message);
    return Result::Answered;
}

} // namespace sorvik::manager
