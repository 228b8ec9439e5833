#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace cv::krn::osdep {

// The local account a security identifier text stands for:
//   S-1-22-1-<uid>  the passwd name of that uid (the Unix-user SIDs of Samba)
//   S-1-1-0         "Everyone"
//   S-1-5-18        "SYSTEM"
// Anything else has no name: other SIDs, a uid without a passwd entry, and
// malformed texts (lower-case "s", signs, spaces, leading zeros, a uid beyond
// 32 bits or the reserved (uid_t)-1).
std::optional<std::u16string> AccountNameForSid(std::u16string_view sid);

} // namespace cv::krn::osdep
