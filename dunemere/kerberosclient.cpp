#include "dunemere/kerberosclient.h"

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/kerberosstatus.h"
#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/tointmsgda.h"
#include "krn/exception/exception.h"
#include "krn/utf.h"

#include <gssapi/gssapi.h>
#include <gssapi/gssapi_krb5.h>

#include <span>
#include <vector>

namespace PLUGIN {

namespace {

constexpr std::u16string_view kSource = u"KerberosClient";
constexpr std::uint32_t kErrorCode = 181;
constexpr OM_uint32 kRequestFlags = GSS_C_DELEG_FLAG | GSS_C_MUTUAL_FLAG | GSS_C_CONF_FLAG;

gss_OID KerberosMechanism()
{
    return const_cast<gss_OID>(gss_mech_krb5);
}

[[noreturn]] void Fail(std::u16string_view text, std::uint32_t position = __builtin_LINE())
{
    throw DataCache::ToIntMsgDa(kSource, position, kErrorCode, text);
}

[[noreturn]] void FailAuthentication(std::u16string_view name, std::uint32_t position = __builtin_LINE())
{
    Fail(u"KerberosClient Error: Authentication failed '" + std::u16string(name) + u"'.", position);
}

void CheckStatus(OM_uint32 major, OM_uint32 minor, std::uint32_t position = __builtin_LINE())
{
    if (GSS_ERROR(major))
        FailAuthentication(KerberosFailureName(major, minor), position);
}

bool KerberosMechanismAvailable()
{
    OM_uint32 minor = 0;
    gss_OID_set mechanisms = GSS_C_NO_OID_SET;
    if (GSS_ERROR(gss_indicate_mechs(&minor, &mechanisms)))
        return false;
    int present = 0;
    gss_test_oid_set_member(&minor, KerberosMechanism(), mechanisms, &present);
    gss_release_oid_set(&minor, &mechanisms);
    return present != 0;
}

// "service@host": one '@' between a service without an instance and a host.
bool IsHostBasedServiceName(std::u16string_view text)
{
    const auto at = text.find(u'@');
    if (at == 0 || at == text.npos || at + 1 == text.size())
        return false;
    return text.find(u'@', at + 1) == text.npos && text.substr(0, at).find(u'/') == text.npos;
}

class OutputToken final
{
public:
    OutputToken() = default;
    ~OutputToken()
    {
        OM_uint32 minor = 0;
        gss_release_buffer(&minor, &m_buffer);
    }
    OutputToken(const OutputToken &) = delete;
    OutputToken &operator=(const OutputToken &) = delete;

    gss_buffer_t Get() { return &m_buffer; }
    std::span<const std::uint8_t> Bytes() const
    {
        return {static_cast<const std::uint8_t *>(m_buffer.value), m_buffer.length};
    }

private:
    gss_buffer_desc m_buffer{0, nullptr};
};

} // namespace

CKerberosClient::CKerberosClient()
{
    if (!KerberosMechanismAvailable())
        Fail(u"KerberosClient Error: could not query security package.");
    AcquireCredentials();
}

CKerberosClient::~CKerberosClient()
{
    OM_uint32 minor = 0;
    if (m_context)
        gss_delete_sec_context(&minor, &m_context, GSS_C_NO_BUFFER);
    if (m_target)
        gss_release_name(&minor, &m_target);
    if (m_credentials)
        gss_release_cred(&minor, &m_credentials);
}

// Without a ticket cache the handle stays empty and StartAuthentication
// tries again, so that a missing log-in surfaces as 'NO_CREDENTIALS' at the
// first step rather than as a construction failure.
void CKerberosClient::AcquireCredentials()
{
    gss_OID_set_desc mechanisms{1, KerberosMechanism()};
    OM_uint32 minor = 0;
    const OM_uint32 major = gss_acquire_cred(&minor, GSS_C_NO_NAME, GSS_C_INDEFINITE, &mechanisms, GSS_C_INITIATE,
                                             &m_credentials, nullptr, nullptr);
    if (!GSS_ERROR(major))
        return;
    m_credentials = GSS_C_NO_CREDENTIAL;
    if (KerberosFailureName(major, minor) != u"NO_CREDENTIALS")
        Fail(u"KerberosClient Error: could not acquire credentials handle.");
}

bool CKerberosClient::StartAuthentication(const cv::krn::ByteBuffer &lastResponse,
                                          cv::vek::rovo::CAuthenticationRequestTransferData &record)
{
    try {
        m_targetName = cv::vek::rovo::tResponseTransferData(lastResponse).Text();
    } catch (const cv::krn::exception::Exception &) {
        FailAuthentication(u"INVALID_TOKEN");
    }
    if (m_targetName.empty())
        FailAuthentication(u"TARGET_UNKNOWN");

    OM_uint32 minor = 0;
    if (m_context)
        gss_delete_sec_context(&minor, &m_context, GSS_C_NO_BUFFER);
    if (m_target)
        gss_release_name(&minor, &m_target);
    m_contextExists = false;
    m_done = false;

    const std::string target = cv::krn::ToUtf8(m_targetName);
    gss_buffer_desc targetText{target.size(), const_cast<char *>(target.data())};
    const gss_OID nameType = IsHostBasedServiceName(m_targetName) ? GSS_C_NT_HOSTBASED_SERVICE
                                                                    : const_cast<gss_OID>(GSS_KRB5_NT_PRINCIPAL_NAME);
    const OM_uint32 major = gss_import_name(&minor, &targetText, nameType, &m_target);
    CheckStatus(major, minor);

    if (m_credentials == GSS_C_NO_CREDENTIAL) {
        AcquireCredentials();
        if (m_credentials == GSS_C_NO_CREDENTIAL)
            FailAuthentication(u"NO_CREDENTIALS");
    }
    return Step(nullptr, 0, record);
}

bool CKerberosClient::ContinueAuthentication(const cv::krn::ByteBuffer &lastResponse,
                                             cv::vek::rovo::CAuthenticationRequestTransferData &record)
{
    if (m_done)
        return false;
    if (!m_contextExists)
        FailAuthentication(u"INVALID_HANDLE");
    std::vector<std::uint8_t> token;
    try {
        token = cv::vek::rovo::tResponseTransferAuthentication(lastResponse).Token();
    } catch (const cv::krn::exception::Exception &) {
        FailAuthentication(u"INVALID_TOKEN");
    }
    // The server ended the log-on without proving who it is.
    if (token.empty())
        Fail(u"KerberosClient Error: no mutual authentication.");
    if (token.size() > m_maxTokenSize)
        FailAuthentication(u"INVALID_TOKEN");
    return Step(token.data(), token.size(), record);
}

bool CKerberosClient::Step(const void *inputToken, std::size_t inputLength,
                           cv::vek::rovo::CAuthenticationRequestTransferData &record)
{
    gss_buffer_desc input{inputLength, const_cast<void *>(inputToken)};
    OutputToken output;
    OM_uint32 minor = 0;
    OM_uint32 returnedFlags = 0;
    const OM_uint32 major = gss_init_sec_context(
        &minor, m_credentials, &m_context, m_target, KerberosMechanism(), kRequestFlags, GSS_C_INDEFINITE,
        GSS_C_NO_CHANNEL_BINDINGS, inputToken ? &input : GSS_C_NO_BUFFER, nullptr, output.Get(), &returnedFlags,
        nullptr);
    CheckStatus(major, minor);
    m_contextExists = true;
    if (output.Bytes().size() > m_maxTokenSize)
        FailAuthentication(u"INSUFFICIENT_MEMORY");

    if (major & GSS_S_CONTINUE_NEEDED) {
        if (output.Bytes().empty())
            FailAuthentication(u"INTERNAL_ERROR");
        record.SetToken(output.Bytes());
        return true;
    }
    if (!(returnedFlags & GSS_C_MUTUAL_FLAG))
        Fail(u"KerberosClient Error: no mutual authentication.");
    m_done = true;
    // A context may complete on a token the server still has to see.
    if (!output.Bytes().empty()) {
        record.SetToken(output.Bytes());
        return true;
    }
    return false;
}

std::u16string CKerberosClient::GetUserName()
{
    OM_uint32 minor = 0;
    gss_name_t name = GSS_C_NO_NAME;
    if (GSS_ERROR(gss_inquire_cred(&minor, m_credentials, &name, nullptr, nullptr, nullptr)))
        return {};
    gss_buffer_desc text{0, nullptr};
    std::u16string userName;
    if (!GSS_ERROR(gss_display_name(&minor, name, &text, nullptr)))
        userName = cv::krn::ToUtf16({static_cast<const char *>(text.value), text.length});
    gss_release_buffer(&minor, &text);
    gss_release_name(&minor, &name);
    return userName;
}

} // namespace PLUGIN
