#pragma once

#include "sorvik/bytebuffer.h"

#include <cstddef>
#include <cstdint>
#include <span>

namespace cv::vek::rovo::comm {

// One end of a connected stream socket that carries records as frames: a u32
// little-endian byte count N, then N bytes holding exactly one record.
//
// Time-outs cover a whole operation (kInfinite waits without limit, 0 does
// not wait). A receive cut short by its time-out keeps what arrived and the
// next receive completes the same record. A send cut short after part of a
// frame was written leaves the stream unusable, so the socket closes itself.
// A frame announcing more than kMaxFrameBytes is refused before anything is
// allocated for it, and the connection is dropped.
//
// Results are the kResult values of sorvik/rovocomm.h. Once closed, every
// operation reports kResultConnectionLost. One thread at a time.
class FramedSocket final
{
public:
    // Takes ownership of a connected stream socket and makes it non-blocking.
    explicit FramedSocket(int fd);
    ~FramedSocket();

    FramedSocket(const FramedSocket &) = delete;
    FramedSocket &operator=(const FramedSocket &) = delete;

    std::uint32_t Send(std::span<const std::uint8_t> record, std::uint32_t timeoutMs);
    // On success the buffer holds the record and nothing else.
    std::uint32_t Receive(krn::ByteBuffer &record, std::uint32_t timeoutMs);

    void Close() noexcept;
    bool IsOpen() const noexcept { return m_fd >= 0; }
    // For waiting on several sockets at once; -1 once closed.
    int Descriptor() const noexcept { return m_fd; }

private:
    std::uint32_t Fail(std::uint32_t result) noexcept;
    std::uint32_t FailWithErrno(int error) noexcept;
    // Moves read-ahead bytes into the frame being received; false when its
    // header announces more than kMaxFrameBytes.
    bool TakeReadAhead();
    bool FrameComplete() const noexcept;
    void GrowPayloadIfFull();

    int m_fd;
    // The frame being received.
    std::uint8_t m_header[4] = {};
    std::size_t m_headerBytes = 0;
    std::uint32_t m_frameSize = 0;
    std::size_t m_payloadBytes = 0;
    krn::ByteBuffer m_payload;
    // Bytes read beyond what the frame needed so far: one read brings a small
    // record's header and payload (and maybe the start of the next) at once.
    static constexpr std::size_t kReadAheadBytes = 4096;
    std::uint8_t m_readAhead[kReadAheadBytes];
    std::size_t m_readAheadBegin = 0;
    std::size_t m_readAheadEnd = 0;
    // The last operation was a send: the answer to it is rarely there yet.
    bool m_sentLast = false;
};

} // namespace cv::vek::rovo::comm
