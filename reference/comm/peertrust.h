#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

namespace cv::vek::rovo::comm {

// A local server is trusted when its socket, the socket's folder and the
// runtime folder above it could only have been put there by this user or
// root (cv::krn::osdep::UntrustedReason), and the process at the other end
// of the connection runs as this user or root. Anyone else could be
// standing in for the server to collect what clients send.
//
// Returns kResultOk, or kResultUntrusted and says why in reason.
std::uint32_t CheckLocalServer(const std::filesystem::path &socketPath, int connectedFd, std::string &reason);

} // namespace cv::vek::rovo::comm
