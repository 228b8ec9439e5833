#include "reference/comm/endpoint.h"

#include "krn/osdep/registry.h"
#include "krn/osdep/runtimefolder.h"
#include "krn/utf.h"
#include "sorvik/rovocomm.h"

#include <arpa/inet.h>
#include <climits>
#include <netinet/in.h>
#include <sys/un.h>
#include <unistd.h>

namespace cv::vek::rovo::comm {

namespace {

char16_t FoldAscii(char16_t c)
{
    return (c >= u'A' && c <= u'Z') ? char16_t(c - u'A' + u'a') : c;
}

bool EqualsIgnoringAsciiCase(std::u16string_view a, std::u16string_view b)
{
    if (a.size() != b.size())
        return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        if (FoldAscii(a[i]) != FoldAscii(b[i]))
            return false;
    }
    return true;
}

std::string WithoutBrackets(std::string host)
{
    if (host.size() >= 2 && host.front() == '[' && host.back() == ']')
        return host.substr(1, host.size() - 2);
    return host;
}

bool IsLoopbackLiteral(const std::string &host)
{
    in_addr v4{};
    if (::inet_pton(AF_INET, host.c_str(), &v4) == 1)
        return (ntohl(v4.s_addr) >> 24) == 127;
    in6_addr v6{};
    if (::inet_pton(AF_INET6, host.c_str(), &v6) == 1) {
        if (IN6_IS_ADDR_LOOPBACK(&v6))
            return true;
        return IN6_IS_ADDR_V4MAPPED(&v6) && v6.s6_addr[12] == 127;
    }
    return false;
}

bool IsThisHostName(std::u16string_view server)
{
    char name[HOST_NAME_MAX + 1] = {};
    if (::gethostname(name, sizeof name - 1) != 0 || name[0] == '\0')
        return false;
    const std::u16string host = krn::ToUtf16(name);
    if (EqualsIgnoringAsciiCase(server, host))
        return true;
    const std::size_t dot = host.find(u'.');
    return dot != std::u16string::npos && EqualsIgnoringAsciiCase(server, std::u16string_view(host).substr(0, dot));
}

bool ParsePort(std::u16string_view text, std::uint16_t &port)
{
    if (text.empty() || text.size() > 5)
        return false;
    std::uint32_t value = 0;
    for (const char16_t c : text) {
        if (c < u'0' || c > u'9')
            return false;
        value = value * 10 + std::uint32_t(c - u'0');
    }
    if (value == 0 || value > 65535)
        return false;
    port = static_cast<std::uint16_t>(value);
    return true;
}

} // namespace

std::filesystem::path RuntimeDirectory()
{
    return krn::osdep::RuntimeDirectory();
}

bool IsThisMachine(std::u16string_view server)
{
    if (server.empty() || EqualsIgnoringAsciiCase(server, u"localhost"))
        return true;
    if (IsLoopbackLiteral(WithoutBrackets(krn::ToUtf8(server))))
        return true;
    return IsThisHostName(server);
}

bool IsValidServiceText(std::u16string_view text)
{
    if (text.empty() || text == u"." || text == u"..")
        return false;
    return text.find_first_of(std::u16string_view(u"/\0", 2)) == std::u16string_view::npos;
}

std::uint32_t LocalSocketPath(std::u16string_view serviceName, std::u16string_view serviceClass,
                              std::filesystem::path &path)
{
    if (!IsValidServiceText(serviceName) || !IsValidServiceText(serviceClass))
        return kResultInvalidArgument;
    std::filesystem::path candidate = RuntimeDirectory() / krn::ToUtf8(serviceClass);
    candidate /= krn::ToUtf8(serviceName) + ".sock";
    if (candidate.native().size() >= sizeof(sockaddr_un::sun_path))
        return kResultInvalidArgument;
    path = std::move(candidate);
    return kResultOk;
}

std::uint32_t ResolveEndpoint(std::u16string_view server, std::u16string_view serviceName,
                              std::u16string_view serviceClass, Endpoint &endpoint)
{
    // A NUL would silently cut the name short on its way to the resolver.
    if (server.find(u'\0') != std::u16string_view::npos)
        return kResultInvalidArgument;
    if (IsThisMachine(server)) {
        UnixEndpoint local;
        const std::uint32_t result = LocalSocketPath(serviceName, serviceClass, local.path);
        if (result == kResultOk)
            endpoint = std::move(local);
        return result;
    }

    if (!IsValidServiceText(serviceName) || !IsValidServiceText(serviceClass))
        return kResultInvalidArgument;
    TcpEndpoint remote{WithoutBrackets(krn::ToUtf8(server)), kDefaultTcpPort};
    const std::u16string configured = krn::osdep::ReadRegistryString(krn::osdep::RegistryHive::LocalMachine,
                                                                      kServicesKey, serviceName);
    if (!configured.empty() && !ParsePort(configured, remote.port))
        return kResultInvalidArgument;
    endpoint = std::move(remote);
    return kResultOk;
}

} // namespace cv::vek::rovo::comm
