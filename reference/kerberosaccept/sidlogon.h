#pragma once

#include <cstdint>
#include <span>
#include <string>

namespace cv::vek::rovo::kerberos {

struct SidLogOn
{
    bool accepted = false;
    std::u16string sid;
    // The local account of the SID, when accepted.
    std::u16string account;
    // Why it was refused, when not accepted.
    std::string error;
};

// The longest SID text: "S-1-", a 48-bit authority and 15 sub-authorities.
inline constexpr std::size_t kMaxSidUnits = 184;

// Reads a SID log-on token (the SID text as UTF-16LE code units, no
// terminator) and accepts it when the SID names a local account.
SidLogOn AcceptSidLogOn(std::span<const std::uint8_t> token);

} // namespace cv::vek::rovo::kerberos
