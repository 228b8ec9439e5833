#pragma once

// Byte-level reading and writing of the transfer records. Every bounds check of
// the decoders goes through TransferReader, which throws instead of reading
// past the end; nothing is allocated for a length field before it has been
// checked against the bytes at hand and a fixed limit.

#include "sorvik/bytebuffer.h"
#include "sorvik/com.h"

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace cv::vek::rovo {

// Largest text a record may carry, plain or after inflation (256 MiB). Far
// above the comm library's 64 MiB frame limit, so compressed answers of
// legitimate size still fit.
inline constexpr std::uint32_t kMaxTextBytes = 256u * 1024u * 1024u;
// Largest authentication token (Kerberos tokens are a few KiB).
inline constexpr std::uint32_t kMaxTokenBytes = 16u * 1024u * 1024u;
// Largest identifier list of a request (16 MiB of GUIDs).
inline constexpr std::uint32_t kMaxIdentifiers = 1024u * 1024u;

class TransferReader
{
public:
    explicit TransferReader(std::span<const std::uint8_t> bytes, std::size_t position = 0);

    std::size_t Position() const noexcept { return m_position; }
    std::size_t Remaining() const noexcept { return m_bytes.size() - m_position; }

    // Throws DeserializationError unless count bytes are left.
    void Need(std::size_t count) const;
    std::span<const std::uint8_t> Take(std::size_t count);
    // The next byte, without moving past it.
    std::uint8_t Peek() const;

    std::uint32_t U32();
    std::int32_t I32();
    GUID Guid();
    // A u32 byte count and that many bytes. A count beyond the remaining bytes
    // throws DeserializationError, one beyond limit throws BufferOverflow.
    std::span<const std::uint8_t> Block(std::uint32_t limit);
    // A block of at most kMaxTextBytes read as UTF-8 (see utf8codec.h).
    std::u16string String();

private:
    std::span<const std::uint8_t> m_bytes;
    std::size_t m_position;
};

class TransferWriter
{
public:
    explicit TransferWriter(krn::ByteBuffer &out) : m_out(out) {}

    void U32(std::uint32_t value);
    // Overwrites four bytes already in the buffer, for a length known only later.
    void PatchU32(std::size_t offset, std::uint32_t value);
    void I32(std::int32_t value) { U32(static_cast<std::uint32_t>(value)); }
    void Guid(const GUID &value);
    void Bytes(std::span<const std::uint8_t> bytes) { m_out.append(bytes.data(), bytes.size()); }
    // A u32 byte count and the bytes; more than a u32 can count throws BufferOverflow.
    void Block(std::span<const std::uint8_t> bytes);
    void String(std::u16string_view text);

private:
    krn::ByteBuffer &m_out;
};

// Raise the foundation exceptions with the caller's position.
[[noreturn]] void ThrowDeserializationError(const char *file = __builtin_FILE(), unsigned line = __builtin_LINE());
[[noreturn]] void ThrowBufferOverflow(const char *file = __builtin_FILE(), unsigned line = __builtin_LINE());

} // namespace cv::vek::rovo
