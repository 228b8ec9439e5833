#pragma once

#include "reference/comm/framedsocket.h"

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace cv::vek::rovo::comm {

// The listening side of the comm transport, for the reference server: it
// listens on the Unix-domain socket of a local service and, when asked, on a
// TCP port, and hands out each accepted connection as a FramedSocket.
//
// Set-up failures raise std::system_error. The socket file is removed again
// when the listener goes, unless another listener has replaced it since.
class Listener final
{
public:
    Listener() = default;
    ~Listener();

    Listener(const Listener &) = delete;
    Listener &operator=(const Listener &) = delete;

    // Listens at RuntimeDirectory()/<class>/<name>.sock, creating the folders
    // for this user alone. A folder that is not this user's or root's, or
    // that other users may change, raises std::system_error (EACCES).
    // A socket file that nobody listens on any more is replaced; one that
    // another process still serves raises std::system_error (EADDRINUSE).
    void ListenLocal(std::u16string_view serviceName, std::u16string_view serviceClass);
    void ListenUnix(const std::filesystem::path &path);

    // Listens on a numeric address ("127.0.0.1", "::1", "0.0.0.0"); port 0
    // takes a free one. Returns the port listened on.
    std::uint16_t ListenTcp(const std::string &address, std::uint16_t port);

    // Waits up to timeoutMs (kInfinite: without limit) for a connection on
    // any of the listening sockets; null when the time ran out.
    std::unique_ptr<FramedSocket> Accept(std::uint32_t timeoutMs);

    const std::filesystem::path &UnixPath() const noexcept { return m_unixPath; }

private:
    std::vector<int> m_fds;
    std::filesystem::path m_unixPath;
    dev_t m_unixDevice = 0;
    ino_t m_unixInode = 0;
};

} // namespace cv::vek::rovo::comm
