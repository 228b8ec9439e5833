#include "dunemere/requesttransferdatabase.h"

#include "dunemere/requestidentifier.h"
#include "dunemere/transferio.h"

#include <new>

namespace cv::vek::rovo {

CRequestTransferDataBase::CRequestTransferDataBase(std::uint32_t version, std::uint32_t category,
                                                   std::uint32_t code)
    : m_version(version), m_category(category), m_code(code), m_requestIdentifier(NewRequestIdentifier())
{
}

CRequestTransferDataBase::~CRequestTransferDataBase() = default;

void CRequestTransferDataBase::RenewRequestIdentifier()
{
    m_requestIdentifier = NewRequestIdentifier();
}

bool CRequestTransferDataBase::Serialize(krn::ByteBuffer &out) const
{
    CheckSendable();
    try {
        TransferWriter writer(out);
        Write(writer);
        return true;
    } catch (const std::bad_alloc &) {
        return false;
    }
}

void CRequestTransferDataBase::Deserialize(std::span<const std::uint8_t> bytes, std::size_t &position)
{
    TransferReader reader(bytes, position);
    Read(reader);
    position = reader.Position();
}

void CRequestTransferDataBase::Write(TransferWriter &out) const
{
    out.U32(SizeTag());
    out.U32(m_version);
    out.U32(0); // reserved
    out.U32(m_category);
    out.U32(m_code);
    out.Guid(m_requestIdentifier);
}

void CRequestTransferDataBase::Read(TransferReader &in)
{
    in.Need(kHeaderSize);
    in.U32(); // size tag
    m_version = in.U32();
    in.U32(); // reserved
    m_category = in.U32();
    m_code = in.U32();
    m_requestIdentifier = in.Guid();
}

} // namespace cv::vek::rovo
