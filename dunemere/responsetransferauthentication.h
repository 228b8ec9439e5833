#pragma once

#include "dunemere/responsetransferdatabase.h"

#include <vector>

namespace cv::vek::rovo {

// The server's answer to a log-on step: the header and the server's token.
class tResponseTransferAuthentication final : public tResponseTransferDataBase
{
public:
    static constexpr std::uint32_t kSizeTag = 48;

    tResponseTransferAuthentication(const GUID &requestIdentifier, std::int32_t status,
                                    std::span<const std::uint8_t> token);
    // Throws krn::exception::DeserializationError for a truncated record and
    // BufferOverflow for a token above kMaxTokenBytes.
    explicit tResponseTransferAuthentication(std::span<const std::uint8_t> received);
    explicit tResponseTransferAuthentication(const krn::ByteBuffer &received)
        : tResponseTransferAuthentication(received.bytes())
    {
    }

    const std::vector<std::uint8_t> &Token() const noexcept { return m_token; }

    // Appends the record; false when memory runs out.
    bool Serialize(krn::ByteBuffer &out) const;

private:
    std::vector<std::uint8_t> m_token;
};

} // namespace cv::vek::rovo
