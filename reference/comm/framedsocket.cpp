#include "reference/comm/framedsocket.h"

#include "reference/comm/deadline.h"
#include "sorvik/rovocomm.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

namespace cv::vek::rovo::comm {

namespace {

// Payload storage grows with what actually arrives, so a peer that announces
// a large frame and sends little costs little.
constexpr std::size_t kFirstChunk = 64 * 1024;

enum class Wait { Ready, TimedOut, Failed };

Wait WaitFor(int fd, short events, const Deadline &deadline)
{
    for (;;) {
        pollfd entry{fd, events, 0};
        const int ready = ::poll(&entry, 1, deadline.RemainingMs());
        if (ready > 0)
            return Wait::Ready; // errors and hang-ups show in the next read or write
        if (ready == 0)
            return Wait::TimedOut;
        if (errno != EINTR)
            return Wait::Failed;
    }
}

bool MeansConnectionLost(int error)
{
    return error == EPIPE || error == ECONNRESET || error == ENOTCONN || error == ECONNABORTED
        || error == ETIMEDOUT || error == EHOSTUNREACH || error == ENETUNREACH || error == ENETDOWN;
}

} // namespace

FramedSocket::FramedSocket(int fd) : m_fd(fd)
{
    const int flags = ::fcntl(m_fd, F_GETFL);
    if (flags >= 0)
        ::fcntl(m_fd, F_SETFL, flags | O_NONBLOCK);
}

FramedSocket::~FramedSocket()
{
    Close();
}

void FramedSocket::Close() noexcept
{
    if (m_fd >= 0)
        ::close(m_fd);
    m_fd = -1;
    m_headerBytes = 0;
    m_payloadBytes = 0;
    m_frameSize = 0;
    m_payload = krn::ByteBuffer();
}

std::uint32_t FramedSocket::Fail(std::uint32_t result) noexcept
{
    Close();
    return result;
}

std::uint32_t FramedSocket::FailWithErrno(int error) noexcept
{
    return Fail(MeansConnectionLost(error) ? kResultConnectionLost : kResultFailure);
}

std::uint32_t FramedSocket::Send(std::span<const std::uint8_t> record, std::uint32_t timeoutMs)
{
    if (m_fd < 0)
        return kResultConnectionLost;
    if (record.size() > kMaxFrameBytes)
        return kResultFrameTooLarge;

    const Deadline deadline(timeoutMs);
    const auto size = static_cast<std::uint32_t>(record.size());
    std::uint8_t header[4] = {std::uint8_t(size), std::uint8_t(size >> 8), std::uint8_t(size >> 16),
                              std::uint8_t(size >> 24)};
    // Header and payload leave in one call: two writes would let Nagle and
    // delayed acknowledgement stall every record on TCP.
    iovec parts[2] = {{header, sizeof header}, {const_cast<std::uint8_t *>(record.data()), record.size()}};
    iovec *next = parts;
    std::size_t partsLeft = record.empty() ? 1 : 2;
    std::size_t sent = 0;

    while (partsLeft > 0) {
        msghdr message{};
        message.msg_iov = next;
        message.msg_iovlen = partsLeft;
        const ssize_t written = ::sendmsg(m_fd, &message, MSG_NOSIGNAL);
        if (written < 0) {
            const int error = errno;
            if (error == EINTR)
                continue;
            if (error != EAGAIN && error != EWOULDBLOCK)
                return FailWithErrno(error);
            const Wait wait = WaitFor(m_fd, POLLOUT, deadline);
            if (wait == Wait::Failed)
                return FailWithErrno(errno);
            if (wait == Wait::TimedOut) {
                // Half a frame on the wire would corrupt every later one.
                if (sent > 0)
                    Close();
                return kResultTimeout;
            }
            continue;
        }
        sent += static_cast<std::size_t>(written);
        auto left = static_cast<std::size_t>(written);
        while (partsLeft > 0 && left >= next->iov_len) {
            left -= next->iov_len;
            ++next;
            --partsLeft;
        }
        if (partsLeft > 0) {
            next->iov_base = static_cast<std::uint8_t *>(next->iov_base) + left;
            next->iov_len -= left;
        }
    }
    return kResultOk;
}

std::uint32_t FramedSocket::Receive(krn::ByteBuffer &record, std::uint32_t timeoutMs)
{
    if (m_fd < 0)
        return kResultConnectionLost;

    const Deadline deadline(timeoutMs);
    for (;;) {
        const bool inHeader = m_headerBytes < sizeof m_header;
        if (!inHeader && m_payloadBytes == m_frameSize) {
            m_payload.resize(m_frameSize);
            record = std::move(m_payload);
            m_payload = krn::ByteBuffer();
            m_headerBytes = 0;
            m_payloadBytes = 0;
            m_frameSize = 0;
            return kResultOk;
        }

        std::uint8_t *target;
        std::size_t wanted;
        if (inHeader) {
            target = m_header + m_headerBytes;
            wanted = sizeof m_header - m_headerBytes;
        } else {
            if (m_payload.size() == m_payloadBytes) {
                const std::size_t grown = std::max(kFirstChunk, m_payloadBytes * 2);
                m_payload.resize(std::min<std::size_t>(m_frameSize, grown));
            }
            target = m_payload.data() + m_payloadBytes;
            wanted = m_payload.size() - m_payloadBytes;
        }

        const ssize_t got = ::recv(m_fd, target, wanted, 0);
        if (got == 0)
            return Fail(kResultConnectionLost);
        if (got < 0) {
            const int error = errno;
            if (error == EINTR)
                continue;
            if (error != EAGAIN && error != EWOULDBLOCK)
                return FailWithErrno(error);
            const Wait wait = WaitFor(m_fd, POLLIN, deadline);
            if (wait == Wait::Failed)
                return FailWithErrno(errno);
            if (wait == Wait::TimedOut)
                return kResultTimeout;
            continue;
        }

        if (inHeader) {
            m_headerBytes += static_cast<std::size_t>(got);
            if (m_headerBytes == sizeof m_header) {
                m_frameSize = std::uint32_t(m_header[0]) | std::uint32_t(m_header[1]) << 8
                    | std::uint32_t(m_header[2]) << 16 | std::uint32_t(m_header[3]) << 24;
                if (m_frameSize > kMaxFrameBytes)
                    return Fail(kResultFrameTooLarge);
                m_payloadBytes = 0;
                m_payload.clear();
            }
        } else {
            m_payloadBytes += static_cast<std::size_t>(got);
        }
    }
}

} // namespace cv::vek::rovo::comm
