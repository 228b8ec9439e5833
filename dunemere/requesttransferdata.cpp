#include "dunemere/requesttransferdata.h"

#include "dunemere/transferio.h"
#include "entry/errors/raiseerror.h"

#include <algorithm>

namespace cv::vek::rovo {

namespace {

constexpr std::uint32_t kVersion2_0_5 = sorvik::PackVersion(2, 0, 5);
constexpr std::uint32_t kVersion3_1_1 = sorvik::PackVersion(3, 1, 1);
constexpr std::uint32_t kVersion17 = sorvik::PackVersion(17, 0, 0);

[[noreturn]] void RaiseIllegalParameterCount(int line)
{
    RaiseError(u"illegal number of parameters", errors::InvalidParameter, u"", line);
}

} // namespace

std::uint32_t RequestParameterCount(std::uint32_t version, std::uint32_t category, std::uint32_t code)
{
    if (version < kVersion2_0_5) {
        switch (code) {
        case 2003:
            return 4;
        case 2001:
        case 2002:
        case 2004:
        case 2005:
        case 3:
        case 1007:
            return 1;
        }
    } else {
        switch (code) {
        case 2003:
            return 5;
        case 2001:
        case 2002:
        case 2004:
        case 2005:
        case 2006:
            return 2;
        case 3:
        case 21:
        case 1007:
            return 1;
        }
    }
    if (category == 2 && version >= kVersion17 && (code == 1002 || code == 1008))
        return 1;
    if (category == 6 && code == 5001)
        return 4;
    if (category == 6 && code == 5002)
        return 3;
    if (category == 4 && code == 3001 && version >= kVersion3_1_1)
        return 2;
    return 0;
}

tRequestTransferData::tRequestTransferData(std::uint32_t version, std::uint32_t category, std::uint32_t code)
    : CRequestTransferDataBase(version, category, code)
{
}

void tRequestTransferData::SetIdentifiers(const GUID *identifiers, std::int32_t count)
{
    if (count <= 0 || !identifiers) {
        m_identifiers.clear();
        m_identifierCount = 0;
        return;
    }
    m_identifiers.assign(identifiers, identifiers + count);
    m_identifierCount = count;
}

const std::u16string &tRequestTransferData::Parameter(std::size_t index) const
{
    if (index >= m_parameters.size())
        RaiseIllegalParameterCount(__LINE__);
    return m_parameters[index];
}

std::u16string_view tRequestTransferData::ParameterOrEmpty(std::size_t index) const noexcept
{
    if (index >= m_parameters.size())
        return {};
    return m_parameters[index];
}

void tRequestTransferData::CheckSendable() const
{
    if (m_parameters.size() < RequestParameterCount(Version(), Category(), Code()))
        RaiseIllegalParameterCount(__LINE__);
}

void tRequestTransferData::Write(TransferWriter &out) const
{
    CRequestTransferDataBase::Write(out);
    for (const std::uint32_t word : m_arguments)
        out.U32(word);
    if (CarriesIdentifierList()) {
        // The count must match the list that follows, whatever was received.
        out.I32(static_cast<std::int32_t>(m_identifiers.size()));
        for (const GUID &identifier : m_identifiers)
            out.Guid(identifier);
    } else {
        out.I32(m_identifierCount);
    }
    const std::uint32_t count = RequestParameterCount(Version(), Category(), Code());
    for (std::uint32_t i = 0; i < count; ++i)
        out.String(m_parameters[i]);
}

void tRequestTransferData::Read(TransferReader &in)
{
    CRequestTransferDataBase::Read(in);
    for (std::uint32_t &word : m_arguments)
        word = in.U32();
    m_identifierCount = std::max(in.I32(), 0);
    m_identifiers.clear();
    if (CarriesIdentifierList()) {
        const auto count = static_cast<std::uint32_t>(m_identifierCount);
        in.Need(std::size_t(count) * 16);
        if (count > kMaxIdentifiers)
            ThrowBufferOverflow();
        m_identifiers.reserve(count);
        for (std::uint32_t i = 0; i < count; ++i)
            m_identifiers.push_back(in.Guid());
    }
    // Each string needs at least its 4-byte count, which bounds the loop
    // before anything is stored.
    const std::uint32_t count = RequestParameterCount(Version(), Category(), Code());
    in.Need(std::size_t(count) * 4);
    m_parameters.clear();
    m_parameters.reserve(count);
    for (std::uint32_t i = 0; i < count; ++i)
        m_parameters.push_back(in.String());
}

} // namespace cv::vek::rovo
