#pragma once

// The library's end of the manager channel: one connection to a running
// server instance, carrying one request at a time.

#include "reference/comm/framedsocket.h"

#include <QJsonObject>

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string_view>

namespace sorvik::manager {

// The channel's socket for an instance ("" for the default local server);
// empty when the port name cannot be a file name.
std::filesystem::path SocketPath(std::u16string_view portName);

class ManagerConnection final
{
public:
    enum class Result
    {
        Answered,
        TimedOut,  // no whole answer within the time-out
        Lost,      // the server closed the connection or has gone
        Malformed, // the answer is not a message
    };

    // Connects without waiting for a server to appear: nullptr with error
    // set to the errno of the failed attempt (ENOENT or ECONNREFUSED: nobody
    // serves the instance; EAGAIN: its queue of new connections stayed full
    // for the time-out; EINVAL: the port name cannot name a socket).
    static std::unique_ptr<ManagerConnection> Open(std::u16string_view portName, std::uint32_t timeoutMs, int &error);

    // Sends the request and waits for its answer; the time-out covers both.
    Result Call(const QJsonObject &request, QJsonObject &answer, std::uint32_t timeoutMs);

    explicit ManagerConnection(int fd) : m_socket(fd) {}

private:
    cv::vek::rovo::comm::FramedSocket m_socket;
};

} // namespace sorvik::manager
