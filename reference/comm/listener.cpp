#include "reference/comm/listener.h"

#include "krn/osdep/runtimefolder.h"
#include "reference/comm/deadline.h"
#include "reference/comm/endpoint.h"
#include "sorvik/rovocomm.h"

#include <arpa/inet.h>
#include <cerrno>
#include <cstring>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <system_error>
#include <unistd.h>

namespace cv::vek::rovo::comm {

namespace {

constexpr int kBacklog = 64;

[[noreturn]] void ThrowErrno(int error, const char *what)
{
    throw std::system_error(error, std::generic_category(), what);
}

// A folder that another user may change would let that user put a socket
// of theirs in the server's place.
void EnsureFolder(const std::filesystem::path &folder)
{
    const std::string reason = krn::osdep::EnsureTrustedFolder(folder);
    if (!reason.empty())
        throw std::system_error(EACCES, std::generic_category(), "socket folder " + reason);
}

sockaddr_un UnixAddress(const std::filesystem::path &path)
{
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    const std::string &text = path.native();
    if (text.size() >= sizeof address.sun_path)
        ThrowErrno(ENAMETOOLONG, "socket path");
    std::memcpy(address.sun_path, text.c_str(), text.size() + 1);
    return address;
}

bool SomebodyListens(const sockaddr_un &address)
{
    const int probe = ::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    if (probe < 0)
        return true; // cannot tell: do not take the name from anyone
    const bool listens = ::connect(probe, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0
        || errno == EAGAIN;
    ::close(probe);
    return listens;
}

} // namespace

Listener::~Listener()
{
    for (const int fd : m_fds)
        ::close(fd);
    if (!m_unixPath.empty()) {
        struct stat status = {};
        if (::lstat(m_unixPath.c_str(), &status) == 0 && status.st_dev == m_unixDevice
            && status.st_ino == m_unixInode)
            ::unlink(m_unixPath.c_str());
    }
}

void Listener::ListenLocal(std::u16string_view serviceName, std::u16string_view serviceClass)
{
    std::filesystem::path path;
    if (LocalSocketPath(serviceName, serviceClass, path) != kResultOk)
        ThrowErrno(EINVAL, "service name or class");
    EnsureFolder(path.parent_path().parent_path());
    EnsureFolder(path.parent_path());
    ListenUnix(path);
}

void Listener::ListenUnix(const std::filesystem::path &path)
{
    if (!m_unixPath.empty())
        ThrowErrno(EISCONN, "already listening on a Unix socket");
    const sockaddr_un address = UnixAddress(path);
    const int fd = ::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    if (fd < 0)
        ThrowErrno(errno, "socket");
    auto bindOnce = [&] { return ::bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0; };
    if (!bindOnce()) {
        const int error = errno;
        struct stat status = {};
        // A socket file left behind by a server that died is taken over.
        const bool stale = error == EADDRINUSE && ::lstat(path.c_str(), &status) == 0 && S_ISSOCK(status.st_mode)
            && !SomebodyListens(address) && ::unlink(path.c_str()) == 0;
        if (!stale || !bindOnce()) {
            const int failure = stale ? errno : error;
            ::close(fd);
            ThrowErrno(failure, "bind");
        }
    }
    struct stat status = {};
    if (::listen(fd, kBacklog) != 0 || ::lstat(path.c_str(), &status) != 0) {
        const int error = errno;
        ::close(fd);
        ThrowErrno(error, "listen");
    }
    m_fds.push_back(fd);
    m_unixPath = path;
    m_unixDevice = status.st_dev;
    m_unixInode = status.st_ino;
}

std::uint16_t Listener::ListenTcp(const std::string &address, std::uint16_t port)
{
    sockaddr_storage storage{};
    socklen_t length = 0;
    auto *v4 = reinterpret_cast<sockaddr_in *>(&storage);
    auto *v6 = reinterpret_cast<sockaddr_in6 *>(&storage);
    if (::inet_pton(AF_INET, address.c_str(), &v4->sin_addr) == 1) {
        v4->sin_family = AF_INET;
        v4->sin_port = htons(port);
        length = sizeof *v4;
    } else if (::inet_pton(AF_INET6, address.c_str(), &v6->sin6_addr) == 1) {
        v6->sin6_family = AF_INET6;
        v6->sin6_port = htons(port);
        length = sizeof *v6;
    } else {
        ThrowErrno(EINVAL, "listen address");
    }

    const int fd = ::socket(storage.ss_family, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    if (fd < 0)
        ThrowErrno(errno, "socket");
    const int on = 1;
    ::setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
    if (::bind(fd, reinterpret_cast<const sockaddr *>(&storage), length) != 0 || ::listen(fd, kBacklog) != 0
        || ::getsockname(fd, reinterpret_cast<sockaddr *>(&storage), &length) != 0) {
        const int error = errno;
        ::close(fd);
        ThrowErrno(error, "listen on TCP");
    }
    m_fds.push_back(fd);
    return ntohs(storage.ss_family == AF_INET ? v4->sin_port : v6->sin6_port);
}

std::unique_ptr<FramedSocket> Listener::Accept(std::uint32_t timeoutMs)
{
    if (m_fds.empty())
        ThrowErrno(ENOTCONN, "not listening");
    const Deadline deadline(timeoutMs);
    std::vector<pollfd> entries;
    for (const int fd : m_fds)
        entries.push_back(pollfd{fd, POLLIN, 0});
    for (;;) {
        const int ready = ::poll(entries.data(), entries.size(), deadline.RemainingMs());
        if (ready < 0) {
            if (errno == EINTR)
                continue;
            ThrowErrno(errno, "poll");
        }
        if (ready == 0)
            return nullptr;
        for (pollfd &entry : entries) {
            if (!(entry.revents & POLLIN))
                continue;
            entry.revents = 0;
            sockaddr_storage peer{};
            socklen_t length = sizeof peer;
            const int fd = ::accept4(entry.fd, reinterpret_cast<sockaddr *>(&peer), &length,
                                     SOCK_NONBLOCK | SOCK_CLOEXEC);
            if (fd < 0) {
                // The peer gave up meanwhile, or another thread took it.
                if (errno == EAGAIN || errno == EWOULDBLOCK || errno == ECONNABORTED || errno == EINTR
                    || errno == EPROTO)
                    continue;
                ThrowErrno(errno, "accept");
            }
            if (peer.ss_family == AF_INET || peer.ss_family == AF_INET6) {
                const int on = 1;
                ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
            }
            return std::make_unique<FramedSocket>(fd);
        }
    }
}

} // namespace cv::vek::rovo::comm
