#include "reference/comm/connector.h"

#include "reference/comm/deadline.h"
#include "sorvik/rovocomm.h"

#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <memory>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <string>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace cv::vek::rovo::comm {

namespace {

void PauseFor(std::chrono::milliseconds interval)
{
    timespec left{static_cast<time_t>(interval.count() / 1000), static_cast<long>(interval.count() % 1000) * 1000000L};
    while (::nanosleep(&left, &left) != 0 && errno == EINTR) {
    }
}

bool ShouldRetryLocal(int error)
{
    // Not there yet, not listening yet, or its backlog is full for a moment.
    return error == ENOENT || error == ECONNREFUSED || error == EAGAIN || error == EINTR;
}

std::uint32_t ConnectUnix(const UnixEndpoint &endpoint, int &fd)
{
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    const std::string &path = endpoint.path.native();
    if (path.size() >= sizeof address.sun_path)
        return kResultInvalidArgument;
    std::memcpy(address.sun_path, path.c_str(), path.size() + 1);

    const auto wait = LocalConnectWait();
    const auto start = std::chrono::steady_clock::now();
    for (;;) {
        const int candidate = ::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
        if (candidate < 0)
            return kResultFailure;
        if (::connect(candidate, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0) {
            fd = candidate;
            return kResultOk;
        }
        const int error = errno;
        ::close(candidate);
        if (!ShouldRetryLocal(error))
            return error == EACCES || error == ENOTDIR ? kResultUnreachable : kResultFailure;
        if (std::chrono::steady_clock::now() - start + kLocalRetryInterval > wait)
            return kResultUnreachable;
        PauseFor(kLocalRetryInterval);
    }
}

bool ConnectWithin(int candidate, const sockaddr *address, socklen_t length)
{
    if (::connect(candidate, address, length) == 0)
        return true;
    if (errno != EINPROGRESS && errno != EINTR)
        return false;
    const Deadline deadline(static_cast<std::uint32_t>(kTcpConnectTimeout.count()));
    for (;;) {
        pollfd entry{candidate, POLLOUT, 0};
        const int ready = ::poll(&entry, 1, deadline.RemainingMs());
        if (ready == 0)
            return false;
        if (ready < 0) {
            if (errno == EINTR)
                continue;
            return false;
        }
        int error = 0;
        socklen_t size = sizeof error;
        return ::getsockopt(candidate, SOL_SOCKET, SO_ERROR, &error, &size) == 0 && error == 0;
    }
}

std::uint32_t ConnectTcp(const TcpEndpoint &endpoint, int &fd)
{
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_NUMERICSERV;
    addrinfo *found = nullptr;
    const std::string port = std::to_string(endpoint.port);
    if (::getaddrinfo(endpoint.host.c_str(), port.c_str(), &hints, &found) != 0 || !found)
        return kResultUnknownHost;
    const std::unique_ptr<addrinfo, decltype(&::freeaddrinfo)> addresses(found, &::freeaddrinfo);

    for (const addrinfo *entry = found; entry; entry = entry->ai_next) {
        const int candidate = ::socket(entry->ai_family, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
        if (candidate < 0)
            continue;
        if (ConnectWithin(candidate, entry->ai_addr, entry->ai_addrlen)) {
            const int on = 1;
            ::setsockopt(candidate, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
            fd = candidate;
            return kResultOk;
        }
        ::close(candidate);
    }
    return kResultUnreachable;
}

} // namespace

std::chrono::milliseconds LocalConnectWait()
{
    const char *text = std::getenv("CORVANE_COMM_CONNECT_WAIT_MS");
    if (!text || !*text)
        return kLocalWait;
    const char *end = text + std::strlen(text);
    std::uint32_t milliseconds = 0;
    const auto [stop, error] = std::from_chars(text, end, milliseconds);
    if (error != std::errc() || stop != end || std::chrono::milliseconds(milliseconds) > kLocalWaitLimit)
        return kLocalWait;
    return std::chrono::milliseconds(milliseconds);
}

std::uint32_t ConnectEndpoint(const Endpoint &endpoint, int &fd)
{
    fd = -1;
    if (const auto *local = std::get_if<UnixEndpoint>(&endpoint))
        return ConnectUnix(*local, fd);
    return ConnectTcp(std::get<TcpEndpoint>(endpoint), fd);
}

} // namespace cv::vek::rovo::comm
