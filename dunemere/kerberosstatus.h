#pragma once

#include <cstdint>
#include <string_view>

namespace PLUGIN {

// The name a failed Kerberos step is reported with ("NO_CREDENTIALS",
// "TARGET_UNKNOWN", ...), from the GSS-API major status and, for the
// mechanism's generic failure, its minor status (a Kerberos error code).
// "unknown errror" for anything without a closer name.
std::u16string_view KerberosFailureName(std::uint32_t major, std::uint32_t minor);

} // namespace PLUGIN
