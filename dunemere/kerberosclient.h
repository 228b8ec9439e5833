#pragma once

#include "dunemere/ikerberosclient.h"

#include <cstdint>
#include <string>

// The GSS-API handle types, kept out of this header's includes.
struct gss_cred_id_struct;
struct gss_ctx_id_struct;
struct gss_name_struct;

namespace PLUGIN {

// Logs on as the current user with a Kerberos exchange (GSS-API, Kerberos
// mechanism) that asks for delegation, mutual authentication and
// confidentiality. The target is the service principal the server names in
// its answer to the permission request: "service@host" is a host-based
// service name, anything else a Kerberos principal name.
//
// Failures raise DataCache::ToIntMsgDa 181 with source "KerberosClient":
// "KerberosClient Error: Authentication failed '<NAME>'." for a failed step
// (names as KerberosFailureName gives them), "KerberosClient Error: no mutual
// authentication." when the exchange ends without the server having proved
// itself. No token or ticket is logged or kept beyond the step.
class CKerberosClient final : public IKerberosClient
{
public:
    // GSS-API has no package query for a token size: this bound is the
    // largest Kerberos token size the other platform's package can be
    // configured to, applied to tokens in both directions.
    static constexpr std::uint32_t kMaxTokenSize = 65535;

    // Throws "KerberosClient Error: could not query security package." when
    // the Kerberos mechanism is not available, and "KerberosClient Error:
    // could not acquire credentials handle." when the current user's
    // credentials cannot be acquired for a reason other than there being
    // none; having none is reported by StartAuthentication as
    // 'NO_CREDENTIALS', as the other platform reports it at its first step.
    CKerberosClient();
    ~CKerberosClient() override;

    // lastResponse is a tResponseTransferData whose text is the target.
    bool StartAuthentication(const cv::krn::ByteBuffer &lastResponse,
                             cv::vek::rovo::CAuthenticationRequestTransferData &record) override;
    // lastResponse is a tResponseTransferAuthentication carrying the server's
    // token. Called while the exchange is not done, a response without a
    // token means the server skipped mutual authentication: that raises.
    bool ContinueAuthentication(const cv::krn::ByteBuffer &lastResponse,
                                cv::vek::rovo::CAuthenticationRequestTransferData &record) override;
    // The principal of the credentials ("alice@REALM"); empty when unknown.
    std::u16string GetUserName() override;

private:
    void AcquireCredentials();
    bool Step(const void *inputToken, std::size_t inputLength,
              cv::vek::rovo::CAuthenticationRequestTransferData &record);

    std::uint32_t m_maxTokenSize = kMaxTokenSize;
    gss_cred_id_struct *m_credentials = nullptr;
    std::u16string m_targetName;
    gss_name_struct *m_target = nullptr;
    gss_ctx_id_struct *m_context = nullptr;
    bool m_contextExists = false;
    bool m_done = false;
};

} // namespace PLUGIN
