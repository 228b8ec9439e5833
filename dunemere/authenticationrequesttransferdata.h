#pragma once

#include "dunemere/requesttransferdatabase.h"

#include <span>
#include <vector>

namespace cv::vek::rovo {

// One step of the log-on exchange: the header and the client's token.
class CAuthenticationRequestTransferData final : public CRequestTransferDataBase
{
public:
    static constexpr std::uint32_t kSizeTag = 64;

    explicit CAuthenticationRequestTransferData(std::uint32_t version = kClientVersion, std::uint32_t category = 4,
                                                std::uint32_t code = 3002);

    std::uint32_t SizeTag() const override { return kSizeTag; }

    // Replacing a token also replaces the request identifier, so that the
    // answer to the earlier token cannot be taken for the answer to this one.
    void SetToken(std::span<const std::uint8_t> token);
    const std::vector<std::uint8_t> &Token() const noexcept { return m_token; }

protected:
    void Write(TransferWriter &out) const override;
    void Read(TransferReader &in) override;

private:
    std::vector<std::uint8_t> m_token;
};

} // namespace cv::vek::rovo
