#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

// The GSS-API handle types, kept out of this header's includes.
struct gss_cred_id_struct;
struct gss_ctx_id_struct;
struct gss_name_struct;

namespace cv::vek::rovo::kerberos {

// Accepts one client's Kerberos log-on with the service key from a keytab.
// The client is required to ask for delegation, mutual authentication and
// confidentiality, as the module's client does; an exchange that completes
// without any of them fails.
class KerberosAcceptor final
{
public:
    enum class Outcome { Continue, Complete, Failed };

    struct StepResult
    {
        Outcome outcome = Outcome::Failed;
        // The token to send back; on Complete the mutual-authentication
        // token, on Failed possibly an error token for the client.
        std::vector<std::uint8_t> token;
        // On Failed: what went wrong, with the GSS-API major and minor
        // status texts.
        std::string error;
    };

    // servicePrincipal is "service@host" (host-based) or a full principal
    // such as "sorvik/localhost@REALM". Throws std::runtime_error when the
    // keytab holds no key for it.
    KerberosAcceptor(const std::string &keytabPath, const std::string &servicePrincipal);
    ~KerberosAcceptor();

    KerberosAcceptor(const KerberosAcceptor &) = delete;
    KerberosAcceptor &operator=(const KerberosAcceptor &) = delete;

    // Feeds the client's next token. After Complete or Failed every further
    // step fails.
    StepResult Step(std::span<const std::uint8_t> token);

    // The authenticated client ("alice@REALM"); empty until Complete.
    const std::string &ClientName() const noexcept { return m_clientName; }
    // The name the client is to target: the text given at construction.
    const std::string &ServicePrincipal() const noexcept { return m_servicePrincipal; }

private:
    StepResult Finish(std::uint32_t returnedFlags, gss_name_struct *client, std::vector<std::uint8_t> token);

    std::string m_servicePrincipal;
    gss_cred_id_struct *m_credentials = nullptr;
    gss_ctx_id_struct *m_context = nullptr;
    std::string m_clientName;
    bool m_finished = false;
};

} // namespace cv::vek::rovo::kerberos
