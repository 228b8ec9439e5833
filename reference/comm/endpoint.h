#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <string_view>
#include <variant>

namespace cv::vek::rovo::comm {

// Where a service lives.
//
// A server that is this machine (empty, "localhost" in any case, a literal
// loopback address, or this host's name) is reached through the Unix-domain
// stream socket RuntimeDirectory()/<class>/<name>.sock. Any other server is
// reached over TCP at the port named like the service in the registry key
// Software\Corvane\Common\Sorvik\Services, default 17320.
struct UnixEndpoint
{
    std::filesystem::path path;
};

struct TcpEndpoint
{
    std::string host; // without the brackets of an IPv6 literal
    std::uint16_t port = 0;
};

using Endpoint = std::variant<UnixEndpoint, TcpEndpoint>;

inline constexpr std::uint16_t kDefaultTcpPort = 17320;
inline constexpr std::u16string_view kServicesKey = u"Software\\Corvane\\Common\\Sorvik\\Services";

// $CORVANE_RUNTIME_DIR, else $XDG_RUNTIME_DIR/corvane, else
// /tmp/corvane-run-<uid>; read on every call (cv::krn::osdep::RuntimeDirectory).
std::filesystem::path RuntimeDirectory();

bool IsThisMachine(std::u16string_view server);

// A service name or class becomes a file or folder name, so it must be one:
// not empty, not "." or "..", no '/' and no NUL.
bool IsValidServiceText(std::u16string_view text);

// The socket path of a local service; kResultInvalidArgument when a text is
// not valid or the path does not fit a socket address.
std::uint32_t LocalSocketPath(std::u16string_view serviceName, std::u16string_view serviceClass,
                              std::filesystem::path &path);

// Resolves the three texts of NewClientSocket. Results: kResultOk,
// kResultInvalidArgument (bad texts, or a registry port that is not a
// number from 1 to 65535).
std::uint32_t ResolveEndpoint(std::u16string_view server, std::u16string_view serviceName,
                              std::u16string_view serviceClass, Endpoint &endpoint);

} // namespace cv::vek::rovo::comm
