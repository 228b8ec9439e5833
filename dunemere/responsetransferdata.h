#pragma once

#include "dunemere/responsetransferdatabase.h"

#include <string>

namespace cv::vek::rovo {

// The server's answer to a request: the header, a numeric value and a text.
// Texts longer than kCompressionThreshold UTF-8 bytes travel as a zlib stream
// followed by flags (bit 0 set) and the uncompressed length U.
class tResponseTransferData final : public tResponseTransferDataBase
{
public:
    static constexpr std::uint32_t kSizeTag = 64;
    static constexpr std::size_t kCompressionThreshold = 131072;
    // zlib cannot expand one input byte into more than 1032 output bytes.
    static constexpr std::uint64_t kMaxInflationRatio = 1032;

    tResponseTransferData(const GUID &requestIdentifier, std::int32_t status, std::uint32_t value,
                          std::u16string text = {});
    // Throws krn::exception::DeserializationError for a truncated record, a
    // compressed payload that does not inflate to exactly U bytes, or a U the
    // payload cannot possibly produce; BufferOverflow for a text above
    // kMaxTextBytes. Nothing is allocated for U before these checks.
    explicit tResponseTransferData(std::span<const std::uint8_t> received);
    explicit tResponseTransferData(const krn::ByteBuffer &received) : tResponseTransferData(received.bytes()) {}

    std::uint32_t Value() const noexcept { return m_value; }
    const std::u16string &Text() const noexcept { return m_text; }

    // Appends the record, compressing a long text; false when memory runs out.
    // A text beyond 4 GiB of UTF-8 throws krn::exception::BufferOverflow.
    bool Serialize(krn::ByteBuffer &out) const;

private:
    std::uint32_t m_value;
    std::u16string m_text;
};

} // namespace cv::vek::rovo
