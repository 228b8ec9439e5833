// The comm library's export: NewClientSocket and the ClientSocket it hands out.

#include "reference/comm/connector.h"
#include "reference/comm/endpoint.h"
#include "reference/comm/framedsocket.h"
#include "sorvik/rovocomm.h"

#include <new>

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
        Endpoint endpoint;
        std::uint32_t result = ResolveEndpoint(server.view(), serviceName.view(), serviceClass.view(), endpoint);
        if (result != kResultOk)
            return AsStatus(result);
        int fd = -1;
        result = ConnectEndpoint(endpoint, fd);
        if (result != kResultOk)
            return AsStatus(result);
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
