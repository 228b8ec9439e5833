#include "dunemere/authenticationrequesttransferdata.h"

#include "dunemere/transferio.h"

namespace cv::vek::rovo {

CAuthenticationRequestTransferData::CAuthenticationRequestTransferData(std::uint32_t version,
                                                                       std::uint32_t category, std::uint32_t code)
    : CRequestTransferDataBase(version, category, code)
{
}

void CAuthenticationRequestTransferData::SetToken(std::span<const std::uint8_t> token)
{
    if (!m_token.empty())
        RenewRequestIdentifier();
    m_token.assign(token.begin(), token.end());
}

void CAuthenticationRequestTransferData::Write(TransferWriter &out) const
{
    CRequestTransferDataBase::Write(out);
    out.Block(m_token);
}

void CAuthenticationRequestTransferData::Read(TransferReader &in)
{
    CRequestTransferDataBase::Read(in);
    const auto token = in.Block(kMaxTokenBytes);
    m_token.assign(token.begin(), token.end());
}

} // namespace cv::vek::rovo
