#pragma once

// UTF-8 <-> UTF-16 for texts on the wire. Malformed input never fails: each
// maximal ill-formed subsequence of UTF-8, and each lone surrogate of UTF-16,
// becomes one U+FFFD, so a garbled text from a peer cannot abort an otherwise
// sound record.

#include <cstddef>
#include <string>
#include <string_view>

namespace cv::vek::rovo {

// Decodes the longest prefix of utf8 that ends on a sequence boundary, or all
// of it when final, into out, which must have room for utf8.size() units.
// Returns {bytes consumed, units written}. A sequence cut by the end of a
// non-final input is left for the next call.
struct Utf8Progress
{
    std::size_t consumed;
    std::size_t written;
};
Utf8Progress DecodeUtf8(std::string_view utf8, bool final, char16_t *out) noexcept;

std::u16string Utf8ToUtf16(std::string_view utf8);
std::string Utf16ToUtf8(std::u16string_view text);
void AppendUtf8(std::u16string_view text, std::string &out);

} // namespace cv::vek::rovo
