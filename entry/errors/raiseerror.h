#pragma once

#include "sorvik/vekexception.h"

#include <cstdint>
#include <string_view>

namespace cv::vek {

// Throws Exception(code, source + "(" + line + "): " + message). Every caller in
// the module passes an empty source name; the line only tells call sites apart.
[[noreturn]] void RaiseError(std::u16string_view message, std::int32_t code, std::u16string_view source,
                             int line);

// Returns text unchanged; a null text raises -1007 "string parameter must not be NULL".
const char16_t *RequireString(const char16_t *text);

} // namespace cv::vek
