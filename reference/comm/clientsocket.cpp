// The comm library's export: NewClientSocket and the ClientSocket it hands out.

#include "krn/osdep/runtimefolder.h"
#include "krn/utf.h"
#include "reference/comm/connector.h"
#include "reference/comm/endpoint.h"
#include "reference/comm/framedsocket.h"
#include "reference/comm/peertrust.h"
#include "sorvik/rovocomm.h"

#include <filesystem>
#include <new>
#include <string>

#include <unistd.h>

namespace cv::vek::rovo::comm {

namespace {

// Used by Send and Receive when they are given a time-out of 0, until
// SetTimeout says otherwise.
constexpr std::uint32_t kDefaultTimeoutMs = 20000;

class CommClientSocket final : public ClientSocket
{
public:
    explicit CommClientSocket(int fd) : m_socket(fd) {}

    void Release() override { delete this; }

    std::uint32_t SetTimeout(std::uint32_t milliseconds) override
    {
        m_timeoutMs = milliseconds;
        return kResultOk;
    }

    std::uint32_t Send(krn::ByteBuffer &buffer, std::uint32_t timeoutMs) override
    {
        return m_socket.Send(buffer.bytes(), Effective(timeoutMs));
    }

    std::uint32_t Receive(krn::ByteBuffer &buffer, std::uint32_t timeoutMs) override
    {
        try {
            return m_socket.Receive(buffer, Effective(timeoutMs));
        } catch (const std::bad_alloc &) {
            // The record cannot be held; what is left of it would be read as
            // the start of the next one.
            m_socket.Close();
            return kResultFailure;
        }
    }

private:
    std::uint32_t Effective(std::uint32_t timeoutMs) const { return timeoutMs == 0 ? m_timeoutMs : timeoutMs; }

    FramedSocket m_socket;
    std::uint32_t m_timeoutMs = kDefaultTimeoutMs;
};

std::int32_t AsStatus(std::uint32_t result)
{
    return static_cast<std::int32_t>(result);
}

thread_local std::string t_lastError;

// A local connection that failed may have failed because the folders are
// somebody else's: that is worth saying instead of "nobody listens".
std::uint32_t ExplainLocalFailure(const Endpoint &endpoint, std::uint32_t result)
{
    const auto *local = std::get_if<UnixEndpoint>(&endpoint);
    if (!local)
        return result;
    const std::filesystem::path serviceFolder = local->path.parent_path();
    for (const auto &folder : {serviceFolder.parent_path(), serviceFolder}) {
        std::error_code missing;
        if (!std::filesystem::exists(std::filesystem::symlink_status(folder, missing)))
            break;
        const std::string reason = krn::osdep::UntrustedReason(folder);
        if (!reason.empty()) {
            t_lastError = "refused the local server at \"" + local->path.string() + "\": " + reason;
            return kResultUntrusted;
        }
    }
    return result;
}

std::uint32_t CheckConnected(const Endpoint &endpoint, int fd)
{
    const auto *local = std::get_if<UnixEndpoint>(&endpoint);
    return local ? CheckLocalServer(local->path, fd, t_lastError) : kResultOk;
}

} // namespace

} // namespace cv::vek::rovo::comm

extern "C" SORVIK_EXPORT std::int32_t NewClientSocket(const cv::krn::WString &server,
                                                      const cv::krn::WString &serviceName,
                                                      const cv::krn::WString &serviceClass,
                                                      cv::vek::rovo::comm::ClientSocket **socket)
{
    using namespace cv::vek::rovo::comm;
    if (!socket)
        return AsStatus(kResultInvalidArgument);
    *socket = nullptr;
    // Nothing may leave through a C entry point.
    try {
        t_lastError.clear();
        Endpoint endpoint;
        std::uint32_t result = ResolveEndpoint(server.view(), serviceName.view(), serviceClass.view(), endpoint);
        if (result != kResultOk)
            return AsStatus(result);
        int fd = -1;
        result = ConnectEndpoint(endpoint, fd);
        if (result != kResultOk)
            return AsStatus(ExplainLocalFailure(endpoint, result));
        result = CheckConnected(endpoint, fd);
        if (result != kResultOk) {
            ::close(fd);
            return AsStatus(result);
        }
        auto *made = new (std::nothrow) CommClientSocket(fd);
        if (!made) {
            ::close(fd);
            return AsStatus(kResultFailure);
        }
        *socket = made;
        return 0;
    } catch (...) {
        return AsStatus(kResultFailure);
    }
}

extern "C" SORVIK_EXPORT void rovoCommGetLastErrorText(cv::krn::WString *text)
{
    if (!text)
        return;
    try {
        *text = cv::krn::WString(cv::krn::ToUtf16(cv::vek::rovo::comm::t_lastError));
    } catch (...) {
    }
}
