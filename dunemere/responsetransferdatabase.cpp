#include "dunemere/responsetransferdatabase.h"

#include "dunemere/transferio.h"

namespace cv::vek::rovo {

tResponseTransferDataBase::tResponseTransferDataBase(std::span<const std::uint8_t> received)
{
    TransferReader in(received);
    in.Need(kHeaderSize);
    m_sizeTag = in.U32();
    m_requestIdentifier = in.Guid();
    m_status = in.I32();
}

tResponseTransferDataBase::tResponseTransferDataBase(std::uint32_t sizeTag, const GUID &requestIdentifier,
                                                     std::int32_t status)
    : m_sizeTag(sizeTag), m_requestIdentifier(requestIdentifier), m_status(status)
{
}

tResponseTransferDataBase::~tResponseTransferDataBase() = default;

void tResponseTransferDataBase::WriteHeader(TransferWriter &out) const
{
    out.U32(m_sizeTag);
    out.Guid(m_requestIdentifier);
    out.I32(m_status);
}

} // namespace cv::vek::rovo
