#pragma once

#include <string>
#include <string_view>

namespace cv::krn {

// Conversions between the library's narrow texts (UTF-8) and its wide texts
// (UTF-16). Malformed input never fails: bad sequences become U+FFFD.
std::string ToUtf8(std::u16string_view text);
std::u16string ToUtf16(std::string_view text);

} // namespace cv::krn
