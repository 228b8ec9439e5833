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

#include <utility>

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
    m_readAheadBegin = 0;
    m_readAheadEnd = 0;
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
    m_sentLast = true;
    return kResultOk;
}

bool FramedSocket::FrameComplete() const noexcept
{
    return m_headerBytes == sizeof m_header && m_payloadBytes == m_frameSize;
}

void FramedSocket::GrowPayloadIfFull()
{
    if (m_payload.size() == m_payloadBytes) {
        const std::size_t grown = std::max(kFirstChunk, m_payloadBytes * 2);
        m_payload.resize(std::min<std::size_t>(m_frameSize, grown));
    }
}

bool FramedSocket::TakeReadAhead()
{
    while (m_readAheadBegin < m_readAheadEnd && !FrameComplete()) {
        const std::uint8_t *from = m_readAhead + m_readAheadBegin;
        const std::size_t available = m_readAheadEnd - m_readAheadBegin;
        if (m_headerBytes < sizeof m_header) {
            const std::size_t taken = std::min(sizeof m_header - m_headerBytes, available);
            std::copy_n(from, taken, m_header + m_headerBytes);
            m_headerBytes += taken;
            m_readAheadBegin += taken;
            if (m_headerBytes == sizeof m_header) {
                m_frameSize = std::uint32_t(m_header[0]) | std::uint32_t(m_header[1]) << 8
                    | std::uint32_t(m_header[2]) << 16 | std::uint32_t(m_header[3]) << 24;
                if (m_frameSize > kMaxFrameBytes)
                    return false;
                m_payloadBytes = 0;
                m_payload.clear();
            }
            continue;
        }
        GrowPayloadIfFull();
        const std::size_t taken = std::min(m_payload.size() - m_payloadBytes, available);
        std::copy_n(from, taken, m_payload.data() + m_payloadBytes);
        m_payloadBytes += taken;
        m_readAheadBegin += taken;
    }
    return true;
}

std::uint32_t FramedSocket::Receive(krn::ByteBuffer &record, std::uint32_t timeoutMs)
{
    if (m_fd < 0)
        return kResultConnectionLost;

    const Deadline deadline(timeoutMs);
    // Right after a send a caller that may wait usually waits for the answer:
    // waiting first saves the read that would only find nothing.
    bool waitFirst = std::exchange(m_sentLast, false) && timeoutMs != 0 && m_headerBytes == 0
        && m_readAheadBegin == m_readAheadEnd;
    for (;;) {
        if (waitFirst) {
            waitFirst = false;
            const Wait wait = WaitFor(m_fd, POLLIN, deadline);
            if (wait == Wait::Failed)
                return FailWithErrno(errno);
            if (wait == Wait::TimedOut)
                return kResultTimeout;
        }
        if (!TakeReadAhead())
            return Fail(kResultFrameTooLarge);
        if (FrameComplete()) {
            m_payload.resize(m_frameSize);
            record = std::move(m_payload);
            m_payload = krn::ByteBuffer();
            m_headerBytes = 0;
            m_payloadBytes = 0;
            m_frameSize = 0;
            return kResultOk;
        }

        // The read-ahead is empty here. A large rest of a payload goes
        // straight to its place; anything else through the read-ahead.
        std::uint8_t *target = m_readAhead;
        std::size_t wanted = kReadAheadBytes;
        const bool direct = m_headerBytes == sizeof m_header && m_frameSize - m_payloadBytes > kReadAheadBytes;
        if (direct) {
            GrowPayloadIfFull();
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
        if (direct) {
            m_payloadBytes += static_cast<std::size_t>(got);
        } else {
            m_readAheadBegin = 0;
            m_readAheadEnd = static_cast<std::size_t>(got);
        }
    }
}

} // namespace cv::vek::rovo::comm
