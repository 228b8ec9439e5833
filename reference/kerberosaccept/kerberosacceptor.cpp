#include "reference/kerberosaccept/kerberosacceptor.h"

#include <gssapi/gssapi.h>
#include <gssapi/gssapi_ext.h>
#include <gssapi/gssapi_krb5.h>

#include <stdexcept>

namespace cv::vek::rovo::kerberos {

namespace {

gss_OID KerberosMechanism()
{
    return const_cast<gss_OID>(gss_mech_krb5);
}

std::string DisplayStatus(OM_uint32 status, int type)
{
    std::string text;
    OM_uint32 messageContext = 0;
    do {
        OM_uint32 minor = 0;
        gss_buffer_desc message{0, nullptr};
        if (GSS_ERROR(gss_display_status(&minor, status, type, KerberosMechanism(), &messageContext, &message)))
            break;
        if (!text.empty())
            text += "; ";
        text.append(static_cast<const char *>(message.value), message.length);
        gss_release_buffer(&minor, &message);
    } while (messageContext != 0);
    return text;
}

std::string StatusText(OM_uint32 major, OM_uint32 minor)
{
    return DisplayStatus(major, GSS_C_GSS_CODE) + " (major " + std::to_string(major) + "); " +
           DisplayStatus(minor, GSS_C_MECH_CODE) + " (minor " + std::to_string(std::int32_t(minor)) + ")";
}

std::string DisplayName(gss_name_t name)
{
    OM_uint32 minor = 0;
    gss_buffer_desc text{0, nullptr};
    if (GSS_ERROR(gss_display_name(&minor, name, &text, nullptr)))
        return {};
    std::string result(static_cast<const char *>(text.value), text.length);
    gss_release_buffer(&minor, &text);
    return result;
}

// "service@host": one '@' between a service without an instance and a host.
bool IsHostBasedServiceName(std::string_view text)
{
    const auto at = text.find('@');
    if (at == 0 || at == text.npos || at + 1 == text.size())
        return false;
    return text.find('@', at + 1) == text.npos && text.substr(0, at).find('/') == text.npos;
}

class Name final
{
public:
    explicit Name(const std::string &text)
    {
        gss_buffer_desc buffer{text.size(), const_cast<char *>(text.data())};
        const gss_OID type = IsHostBasedServiceName(text) ? GSS_C_NT_HOSTBASED_SERVICE
                                                          : const_cast<gss_OID>(GSS_KRB5_NT_PRINCIPAL_NAME);
        OM_uint32 minor = 0;
        const OM_uint32 major = gss_import_name(&minor, &buffer, type, &m_name);
        if (GSS_ERROR(major))
            throw std::runtime_error("service principal '" + text + "' not usable: " + StatusText(major, minor));
    }
    ~Name()
    {
        OM_uint32 minor = 0;
        gss_release_name(&minor, &m_name);
    }
    Name(const Name &) = delete;
    Name &operator=(const Name &) = delete;

    gss_name_t Get() const { return m_name; }

private:
    gss_name_t m_name = GSS_C_NO_NAME;
};

std::vector<std::uint8_t> TakeBuffer(gss_buffer_desc &buffer)
{
    const auto *bytes = static_cast<const std::uint8_t *>(buffer.value);
    std::vector<std::uint8_t> copy(bytes, bytes + buffer.length);
    OM_uint32 minor = 0;
    gss_release_buffer(&minor, &buffer);
    return copy;
}

std::string MissingFlags(OM_uint32 flags)
{
    std::string missing;
    const auto note = [&](OM_uint32 flag, const char *what) {
        if (flags & flag)
            return;
        if (!missing.empty())
            missing += ", ";
        missing += what;
    };
    note(GSS_C_DELEG_FLAG, "delegation (is the ticket forwardable?)");
    note(GSS_C_MUTUAL_FLAG, "mutual authentication");
    note(GSS_C_CONF_FLAG, "confidentiality");
    return missing;
}

} // namespace

KerberosAcceptor::KerberosAcceptor(const std::string &keytabPath, const std::string &servicePrincipal)
    : m_servicePrincipal(servicePrincipal)
{
    const Name name(servicePrincipal);
    gss_key_value_element_desc keytab{"keytab", keytabPath.c_str()};
    gss_key_value_set_desc store{1, &keytab};
    gss_OID_set_desc mechanisms{1, KerberosMechanism()};
    OM_uint32 minor = 0;
    const OM_uint32 major = gss_acquire_cred_from(&minor, name.Get(), GSS_C_INDEFINITE, &mechanisms, GSS_C_ACCEPT,
                                                  &store, &m_credentials, nullptr, nullptr);
    if (GSS_ERROR(major))
        throw std::runtime_error("no acceptor credentials for '" + servicePrincipal + "' in keytab '" + keytabPath +
                                 "': " + StatusText(major, minor));
}

KerberosAcceptor::~KerberosAcceptor()
{
    OM_uint32 minor = 0;
    if (m_context)
        gss_delete_sec_context(&minor, &m_context, GSS_C_NO_BUFFER);
    if (m_credentials)
        gss_release_cred(&minor, &m_credentials);
}

KerberosAcceptor::StepResult KerberosAcceptor::Step(std::span<const std::uint8_t> token)
{
    StepResult result;
    if (m_finished) {
        result.error = "the log-on exchange has already ended";
        return result;
    }
    if (token.empty()) {
        m_finished = true;
        result.error = "the client sent an empty token";
        return result;
    }

    gss_buffer_desc input{token.size(), const_cast<std::uint8_t *>(token.data())};
    gss_buffer_desc output{0, nullptr};
    gss_name_t client = GSS_C_NO_NAME;
    OM_uint32 returnedFlags = 0;
    OM_uint32 minor = 0;
    // Delegated credentials are not asked for, so the library drops them.
    const OM_uint32 major =
        gss_accept_sec_context(&minor, &m_context, m_credentials, &input, GSS_C_NO_CHANNEL_BINDINGS, &client,
                               nullptr, &output, &returnedFlags, nullptr, nullptr);
    result.token = TakeBuffer(output);

    if (GSS_ERROR(major)) {
        m_finished = true;
        OM_uint32 ignored = 0;
        gss_release_name(&ignored, &client);
        result.error = "Kerberos log-on refused: " + StatusText(major, minor);
        return result;
    }
    if (major & GSS_S_CONTINUE_NEEDED) {
        gss_release_name(&minor, &client);
        result.outcome = Outcome::Continue;
        return result;
    }
    return Finish(returnedFlags, client, std::move(result.token));
}

KerberosAcceptor::StepResult KerberosAcceptor::Finish(std::uint32_t returnedFlags, gss_name_struct *client,
                                                      std::vector<std::uint8_t> token)
{
    m_finished = true;
    StepResult result;
    const std::string clientName = DisplayName(client);
    OM_uint32 minor = 0;
    gss_release_name(&minor, &client);

    const std::string missing = MissingFlags(returnedFlags);
    if (!missing.empty()) {
        result.error = "Kerberos log-on of '" + clientName + "' lacks " + missing;
        return result;
    }
    if (clientName.empty()) {
        result.error = "Kerberos log-on without a client name";
        return result;
    }
    m_clientName = clientName;
    result.outcome = Outcome::Complete;
    result.token = std::move(token);
    return result;
}

} // namespace cv::vek::rovo::kerberos
