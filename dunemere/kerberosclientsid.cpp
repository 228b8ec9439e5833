#include "dunemere/kerberosclientsid.h"

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/tointmsgda.h"
#include "krn/osdep/sidaccount.h"

#include <cstdint>
#include <vector>

namespace PLUGIN {

namespace {

constexpr std::u16string_view kSource = u"KerberosClientSID";

std::vector<std::uint8_t> Utf16LittleEndian(std::u16string_view text)
{
    std::vector<std::uint8_t> bytes;
    bytes.reserve(text.size() * 2);
    for (const char16_t unit : text) {
        bytes.push_back(std::uint8_t(unit & 0xFF));
        bytes.push_back(std::uint8_t(unit >> 8));
    }
    return bytes;
}

} // namespace

CKerberosClientSID::CKerberosClientSID(std::u16string sid)
    : m_sid(std::move(sid))
{
    if (m_sid.empty())
        throw DataCache::ToIntMsgDa(kSource, 181, u"KerberosClientSID Error: SID empty");
}

bool CKerberosClientSID::StartAuthentication(const cv::krn::ByteBuffer &,
                                             cv::vek::rovo::CAuthenticationRequestTransferData &record)
{
    record.SetToken(Utf16LittleEndian(m_sid));
    return true;
}

bool CKerberosClientSID::ContinueAuthentication(const cv::krn::ByteBuffer &,
                                                cv::vek::rovo::CAuthenticationRequestTransferData &)
{
    return false;
}

std::u16string CKerberosClientSID::GetUserName()
{
    return cv::krn::osdep::AccountNameForSid(m_sid).value_or(std::u16string());
}

} // namespace PLUGIN
