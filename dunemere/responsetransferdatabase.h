#pragma once

#include "sorvik/bytebuffer.h"
#include "sorvik/com.h"

#include <cstddef>
#include <cstdint>
#include <span>

namespace cv::vek::rovo {

class TransferWriter;

// Header of every response: size tag, identifier of the request answered and
// status (24 bytes). Reading it alone is enough to match a response to its
// request before deciding what kind it is.
class tResponseTransferDataBase
{
public:
    static constexpr std::size_t kHeaderSize = 24;

    // Reads the header of a received response. Fewer than 24 bytes throw
    // krn::exception::DeserializationError. The size tag is kept but not checked.
    explicit tResponseTransferDataBase(std::span<const std::uint8_t> received);
    explicit tResponseTransferDataBase(const krn::ByteBuffer &received)
        : tResponseTransferDataBase(received.bytes())
    {
    }
    tResponseTransferDataBase(const tResponseTransferDataBase &) = default;
    tResponseTransferDataBase &operator=(const tResponseTransferDataBase &) = default;
    virtual ~tResponseTransferDataBase();

    std::uint32_t SizeTag() const noexcept { return m_sizeTag; }
    const GUID &RequestIdentifier() const noexcept { return m_requestIdentifier; }
    std::int32_t Status() const noexcept { return m_status; }

protected:
    tResponseTransferDataBase(std::uint32_t sizeTag, const GUID &requestIdentifier, std::int32_t status);

    void WriteHeader(TransferWriter &out) const;

private:
    std::uint32_t m_sizeTag;
    GUID m_requestIdentifier;
    std::int32_t m_status;
};

} // namespace cv::vek::rovo
