#include "reference/kerberosaccept/sidlogon.h"

#include "krn/osdep/sidaccount.h"

namespace cv::vek::rovo::kerberos {

SidLogOn AcceptSidLogOn(std::span<const std::uint8_t> token)
{
    SidLogOn result;
    if (token.empty()) {
        result.error = "empty SID token";
        return result;
    }
    if (token.size() % 2 != 0) {
        result.error = "SID token of odd length " + std::to_string(token.size());
        return result;
    }
    if (token.size() / 2 > kMaxSidUnits) {
        result.error = "SID token longer than any SID (" + std::to_string(token.size()) + " bytes)";
        return result;
    }
    for (std::size_t i = 0; i < token.size(); i += 2)
        result.sid += char16_t(token[i] | (token[i + 1] << 8));
    const auto account = cv::krn::osdep::AccountNameForSid(result.sid);
    if (!account) {
        result.error = "SID names no local account";
        return result;
    }
    result.accepted = true;
    result.account = *account;
    return result;
}

} // namespace cv::vek::rovo::kerberos
