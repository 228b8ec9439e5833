#pragma once

#include "reference/comm/endpoint.h"

#include <chrono>
#include <cstdint>

namespace cv::vek::rovo::comm {

// A local server that was just started needs a moment before it listens:
// while its socket does not exist or refuses, connecting is tried again
// every kLocalRetryInterval for up to LocalConnectWait().
inline constexpr std::chrono::milliseconds kLocalRetryInterval{50};
inline constexpr std::chrono::milliseconds kLocalWait{5000};
inline constexpr std::chrono::milliseconds kLocalWaitLimit{60000};

// kLocalWait, or the milliseconds that $CORVANE_COMM_CONNECT_WAIT_MS gives
// (0 to kLocalWaitLimit; anything else is ignored).
std::chrono::milliseconds LocalConnectWait();

// A remote server gets this long for each of its addresses.
inline constexpr std::chrono::milliseconds kTcpConnectTimeout{5000};

// Connects a stream socket to the endpoint. Returns kResultOk and the
// socket's descriptor (close-on-exec, non-blocking, TCP_NODELAY on TCP), or
// kResultUnreachable, kResultUnknownHost or kResultFailure and fd -1.
std::uint32_t ConnectEndpoint(const Endpoint &endpoint, int &fd);

} // namespace cv::vek::rovo::comm
