#include "dunemere/kerberosstatus.h"

#include <gssapi/gssapi.h>
#include <krb5/krb5.h>

#include <cerrno>

namespace PLUGIN {

namespace {

constexpr std::u16string_view kUnknown = u"unknown errror";

// GSS_S_FAILURE covers most Kerberos errors; the Kerberos code says which.
std::u16string_view MechanismFailureName(std::int32_t code)
{
    switch (code) {
    case ENOMEM:
        return u"INSUFFICIENT_MEMORY";
    case KRB5KDC_ERR_S_PRINCIPAL_UNKNOWN:
    case KRB5_REALM_UNKNOWN:
        return u"TARGET_UNKNOWN";
    case KRB5KRB_AP_WRONG_PRINC:
    case KRB5KRB_AP_ERR_NOKEY:
    case KRB5KRB_AP_ERR_BADKEYVER:
    case KRB5KRB_AP_ERR_NOT_US:
    case KRB5_KT_NOTFOUND:
        return u"WRONG_PRINCIPAL";
    case KRB5_KDC_UNREACH:
    case KRB5_REALM_CANT_RESOLVE:
        return u"NO_AUTHENTICATING_AUTHORITY";
    case KRB5_FCC_NOFILE:
    case KRB5_CC_NOTFOUND:
    case KRB5_CC_END:
    case KRB5KRB_AP_ERR_TKT_EXPIRED:
    case KRB5KDC_ERR_TGT_REVOKED:
        return u"NO_CREDENTIALS";
    case KRB5KDC_ERR_CLIENT_REVOKED:
    case KRB5KDC_ERR_KEY_EXP:
    case KRB5KDC_ERR_POLICY:
    case KRB5KDC_ERR_C_PRINCIPAL_UNKNOWN:
        return u"LOGON_DENIED";
    case KRB5KRB_AP_ERR_MODIFIED:
    case KRB5KRB_AP_ERR_BAD_INTEGRITY:
    case KRB5KRB_AP_ERR_MSG_TYPE:
    case KRB5KRB_AP_ERR_BADVERSION:
    case KRB5KRB_AP_ERR_REPEAT:
    case KRB5KRB_AP_ERR_SKEW:
    case KRB5KRB_AP_ERR_INAPP_CKSUM:
    case KRB5_BAD_MSIZE:
    case KRB5_BADMSGTYPE:
        return u"INVALID_TOKEN";
    default:
        return kUnknown;
    }
}

} // namespace

std::u16string_view KerberosFailureName(std::uint32_t major, std::uint32_t minor)
{
    if (GSS_CALLING_ERROR(major))
        return u"INTERNAL_ERROR";
    switch (GSS_ROUTINE_ERROR(major)) {
    case GSS_S_BAD_MECH:
        return u"UNSUPPORTED_FUNCTION";
    case GSS_S_BAD_NAME:
    case GSS_S_BAD_NAMETYPE:
        return u"TARGET_UNKNOWN";
    case GSS_S_BAD_BINDINGS:
    case GSS_S_BAD_SIG:
    case GSS_S_DEFECTIVE_TOKEN:
        return u"INVALID_TOKEN";
    case GSS_S_BAD_STATUS:
        return u"INTERNAL_ERROR";
    case GSS_S_NO_CRED:
    case GSS_S_DEFECTIVE_CREDENTIAL:
    case GSS_S_CREDENTIALS_EXPIRED:
        return u"NO_CREDENTIALS";
    case GSS_S_NO_CONTEXT:
        return u"INVALID_HANDLE";
    case GSS_S_UNAVAILABLE:
        return u"UNSUPPORTED_FUNCTION";
    case GSS_S_FAILURE:
        return MechanismFailureName(std::int32_t(minor));
    default:
        return kUnknown;
    }
}

} // namespace PLUGIN
