#pragma once

#include "sorvik/com.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace cv::vek::rovo {

class tRequestTransferData;

// HMAC-SHA256 of message under key as 64 lower-case hexadecimal digits; empty
// when the MAC computation fails.
std::string HmacSha256Hex(std::span<const std::uint8_t> key, std::span<const std::uint8_t> message);

// The proof that the client knows secretKey: HmacSha256Hex(UTF-8 of secretKey,
// UTF-8 of identification followed by the identifier's upper-case text form).
// The key itself never goes on the wire.
std::u16string ComputeClientProof(std::u16string_view secretKey, std::u16string_view identification,
                                  const GUID &requestIdentifier);

// Appends the two parameters of a permission request whose version expects
// them (3.1.1 and later; older versions get none): the identification and its
// proof for the request's identifier, or two empty texts when either
// identification or key is empty. Call it after the request's identifier is
// final: the proof depends on it.
void AddPermissionParameters(tRequestTransferData &request, std::u16string_view identification,
                             std::u16string_view secretKey);

} // namespace cv::vek::rovo
