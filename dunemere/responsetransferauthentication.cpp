#include "dunemere/responsetransferauthentication.h"

#include "dunemere/transferio.h"

#include <new>

namespace cv::vek::rovo {

tResponseTransferAuthentication::tResponseTransferAuthentication(const GUID &requestIdentifier,
                                                                 std::int32_t status,
                                                                 std::span<const std::uint8_t> token)
    : tResponseTransferDataBase(kSizeTag, requestIdentifier, status), m_token(token.begin(), token.end())
{
}

tResponseTransferAuthentication::tResponseTransferAuthentication(std::span<const std::uint8_t> received)
    : tResponseTransferDataBase(received)
{
    TransferReader in(received, kHeaderSize);
    const auto token = in.Block(kMaxTokenBytes);
    m_token.assign(token.begin(), token.end());
}

bool tResponseTransferAuthentication::Serialize(krn::ByteBuffer &out) const
{
    try {
        TransferWriter writer(out);
        WriteHeader(writer);
        writer.Block(m_token);
        return true;
    } catch (const std::bad_alloc &) {
        return false;
    }
}

} // namespace cv::vek::rovo
