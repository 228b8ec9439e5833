#include "dunemere/responsetransferdata.h"

#include "dunemere/transferio.h"
#include "dunemere/utf8codec.h"

#include <zlib.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <memory>
#include <new>

namespace cv::vek::rovo {

namespace {

class InflateStream
{
public:
    InflateStream()
    {
        if (inflateInit(&m_stream) != Z_OK)
            throw std::bad_alloc();
    }
    ~InflateStream() { inflateEnd(&m_stream); }
    InflateStream(const InflateStream &) = delete;
    InflateStream &operator=(const InflateStream &) = delete;

    z_stream *operator->() noexcept { return &m_stream; }
    z_stream *get() noexcept { return &m_stream; }

private:
    z_stream m_stream{};
};

// Inflates payload, which must yield exactly expected bytes, and decodes them
// as UTF-8. Inflating piece by piece into a small buffer keeps the text's
// bytes in cache for the decoder and never holds them twice in full.
std::u16string InflateText(std::span<const std::uint8_t> payload, std::uint32_t expected)
{
    if (expected > kMaxTextBytes)
        ThrowBufferOverflow();
    if (expected > payload.size() * tResponseTransferData::kMaxInflationRatio)
        ThrowDeserializationError();

    // Room for a cut sequence of up to three bytes plus at least one more.
    const std::size_t piece = std::min<std::size_t>(256 * 1024, std::size_t(expected) + 4);
    const std::unique_ptr<char[]> bytes(new char[piece]);
    const std::unique_ptr<char16_t[]> units(new char16_t[piece]);
    std::u16string text;
    text.reserve(expected);

    InflateStream stream;
    stream->next_in = const_cast<Bytef *>(payload.data());
    stream->avail_in = static_cast<uInt>(payload.size());
    std::size_t carried = 0; // start of a UTF-8 sequence cut by the last piece
    for (;;) {
        // Room for one byte more than expected, so that a stream that is too
        // long shows itself without ever producing much.
        const std::uint64_t left = std::uint64_t(expected) + 1 - stream->total_out;
        const auto room = static_cast<uInt>(std::min<std::uint64_t>(piece - carried, left));
        stream->next_out = reinterpret_cast<Bytef *>(bytes.get() + carried);
        stream->avail_out = room;
        const int result = inflate(stream.get(), Z_NO_FLUSH);
        if (result == Z_MEM_ERROR)
            throw std::bad_alloc();
        if (result != Z_OK && result != Z_STREAM_END)
            ThrowDeserializationError(); // corrupt, or cut short (no progress possible)
        if (stream->total_out > expected)
            ThrowBufferOverflow();

        const bool ended = result == Z_STREAM_END;
        const std::size_t filled = carried + (room - stream->avail_out);
        const Utf8Progress progress = DecodeUtf8({bytes.get(), filled}, ended, units.get());
        text.append(units.get(), progress.written);
        carried = filled - progress.consumed;
        std::memmove(bytes.get(), bytes.get() + progress.consumed, carried);
        if (ended)
            break;
    }
    if (stream->total_out != expected)
        ThrowDeserializationError();
    return text;
}

} // namespace

tResponseTransferData::tResponseTransferData(const GUID &requestIdentifier, std::int32_t status,
                                             std::uint32_t value, std::u16string text)
    : tResponseTransferDataBase(kSizeTag, requestIdentifier, status), m_value(value), m_text(std::move(text))
{
}

tResponseTransferData::tResponseTransferData(std::span<const std::uint8_t> received)
    : tResponseTransferDataBase(received)
{
    TransferReader in(received, kHeaderSize);
    m_value = in.U32();
    const std::size_t textStart = in.Position();
    const auto payload = in.Block(std::numeric_limits<std::uint32_t>::max());
    // Older servers end the record after the payload; only a set bit 0 of the
    // following byte means compressed.
    if (in.Remaining() > 0 && (in.Peek() & 1) != 0) {
        in.U32(); // flags
        const std::uint32_t uncompressed = in.U32();
        m_text = InflateText(payload, uncompressed);
        return;
    }
    TransferReader plain(received, textStart);
    m_text = plain.String();
}

bool tResponseTransferData::Serialize(krn::ByteBuffer &out) const
{
    try {
        TransferWriter writer(out);
        WriteHeader(writer);
        writer.U32(m_value);
        const std::string utf8 = Utf16ToUtf8(m_text);
        const auto *raw = reinterpret_cast<const Bytef *>(utf8.data());
        if (utf8.size() <= kCompressionThreshold) {
            writer.Block({raw, utf8.size()});
            return true;
        }
        if (utf8.size() > std::numeric_limits<std::uint32_t>::max())
            ThrowBufferOverflow();

        // Deflate straight into the buffer behind a length word filled in afterwards.
        const std::size_t lengthOffset = out.size();
        uLongf compressedLength = compressBound(static_cast<uLong>(utf8.size()));
        out.resize(lengthOffset + 4 + compressedLength);
        const int result = compress2(out.data() + lengthOffset + 4, &compressedLength, raw,
                                     static_cast<uLong>(utf8.size()), Z_DEFAULT_COMPRESSION);
        if (result != Z_OK)
            throw std::bad_alloc(); // Z_MEM_ERROR; compressBound rules out Z_BUF_ERROR
        if (compressedLength > std::numeric_limits<std::uint32_t>::max())
            ThrowBufferOverflow();
        out.resize(lengthOffset + 4 + compressedLength);
        writer.PatchU32(lengthOffset, static_cast<std::uint32_t>(compressedLength));
        writer.U32(1); // flags: compressed
        writer.U32(static_cast<std::uint32_t>(utf8.size()));
        return true;
    } catch (const std::bad_alloc &) {
        return false;
    }
}

} // namespace cv::vek::rovo
