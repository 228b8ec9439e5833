#include "reference/comm/peertrust.h"

#include "krn/osdep/runtimefolder.h"
#include "sorvik/rovocomm.h"

#include <sys/socket.h>
#include <unistd.h>

#include <string>

namespace cv::vek::rovo::comm {

namespace {

std::string PeerReason(int fd)
{
    ucred peer{};
    socklen_t size = sizeof peer;
    if (::getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0)
        return "the server's user cannot be told";
    if (peer.uid != ::geteuid() && peer.uid != 0)
        return "the server runs as user " + std::to_string(peer.uid) + ", not as this user or root";
    return {};
}

std::string UntrustedReason(const std::filesystem::path &socketPath, int fd)
{
    const std::filesystem::path serviceFolder = socketPath.parent_path();
    for (const auto &path : {serviceFolder.parent_path(), serviceFolder, socketPath}) {
        std::string reason = krn::osdep::UntrustedReason(path);
        if (!reason.empty())
            return reason;
    }
    return PeerReason(fd);
}

} // namespace

std::uint32_t CheckLocalServer(const std::filesystem::path &socketPath, int connectedFd, std::string &reason)
{
    reason = UntrustedReason(socketPath, connectedFd);
    if (reason.empty())
        return kResultOk;
    reason = "refused the local server at \"" + socketPath.string() + "\": " + reason;
    return kResultUntrusted;
}

} // namespace cv::vek::rovo::comm
