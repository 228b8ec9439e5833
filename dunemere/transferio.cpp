#include "dunemere/transferio.h"

#include "dunemere/utf8codec.h"

#include "krn/exception/bufferoverflow.h"
#include "krn/exception/deserializationerror.h"

#include <limits>

namespace cv::vek::rovo {

void ThrowDeserializationError(const char *file, unsigned line)
{
    throw krn::exception::DeserializationError(file, line);
}

void ThrowBufferOverflow(const char *file, unsigned line)
{
    throw krn::exception::BufferOverflow(file, line);
}

TransferReader::TransferReader(std::span<const std::uint8_t> bytes, std::size_t position)
    : m_bytes(bytes), m_position(position)
{
    if (position > bytes.size())
        ThrowDeserializationError();
}

void TransferReader::Need(std::size_t count) const
{
    if (count > Remaining())
        ThrowDeserializationError();
}

std::span<const std::uint8_t> TransferReader::Take(std::size_t count)
{
    Need(count);
    const auto taken = m_bytes.subspan(m_position, count);
    m_position += count;
    return taken;
}

std::uint8_t TransferReader::Peek() const
{
    Need(1);
    return m_bytes[m_position];
}

std::uint32_t TransferReader::U32()
{
    const auto b = Take(4);
    return std::uint32_t(b[0]) | std::uint32_t(b[1]) << 8 | std::uint32_t(b[2]) << 16 | std::uint32_t(b[3]) << 24;
}

std::int32_t TransferReader::I32()
{
    return static_cast<std::int32_t>(U32());
}

GUID TransferReader::Guid()
{
    Need(16);
    GUID value{};
    value.Data1 = U32();
    const auto b = Take(12);
    value.Data2 = std::uint16_t(b[0] | b[1] << 8);
    value.Data3 = std::uint16_t(b[2] | b[3] << 8);
    for (int i = 0; i < 8; ++i)
        value.Data4[i] = b[4 + i];
    return value;
}

std::span<const std::uint8_t> TransferReader::Block(std::uint32_t limit)
{
    const std::uint32_t count = U32();
    Need(count);
    if (count > limit)
        ThrowBufferOverflow();
    return Take(count);
}

std::u16string TransferReader::String()
{
    const auto bytes = Block(kMaxTextBytes);
    return Utf8ToUtf16({reinterpret_cast<const char *>(bytes.data()), bytes.size()});
}

void TransferWriter::U32(std::uint32_t value)
{
    const std::uint8_t b[4] = {std::uint8_t(value), std::uint8_t(value >> 8), std::uint8_t(value >> 16),
                               std::uint8_t(value >> 24)};
    m_out.append(b, sizeof b);
}

void TransferWriter::PatchU32(std::size_t offset, std::uint32_t value)
{
    std::uint8_t *at = m_out.data() + offset;
    for (int i = 0; i < 4; ++i)
        at[i] = static_cast<std::uint8_t>(value >> (8 * i));
}

void TransferWriter::Guid(const GUID &value)
{
    std::uint8_t b[16] = {std::uint8_t(value.Data1),       std::uint8_t(value.Data1 >> 8),
                          std::uint8_t(value.Data1 >> 16), std::uint8_t(value.Data1 >> 24),
                          std::uint8_t(value.Data2),       std::uint8_t(value.Data2 >> 8),
                          std::uint8_t(value.Data3),       std::uint8_t(value.Data3 >> 8)};
    for (int i = 0; i < 8; ++i)
        b[8 + i] = value.Data4[i];
    m_out.append(b, sizeof b);
}

void TransferWriter::Block(std::span<const std::uint8_t> bytes)
{
    if (bytes.size() > std::numeric_limits<std::uint32_t>::max())
        ThrowBufferOverflow();
    U32(static_cast<std::uint32_t>(bytes.size()));
    Bytes(bytes);
}

void TransferWriter::String(std::u16string_view text)
{
    const std::string utf8 = Utf16ToUtf8(text);
    Block({reinterpret_cast<const std::uint8_t *>(utf8.data()), utf8.size()});
}

} // namespace cv::vek::rovo
