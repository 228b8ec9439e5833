#pragma once

// Text helpers shared by the log's classes.

#include <charconv>
#include <concepts>
#include <cstdarg>
#include <cstddef>
#include <string>
#include <string_view>

namespace cv::util::file::log::text {

// Size of the buffer printf-style appends format into; the result keeps at
// most one character less.
inline constexpr std::size_t kFormatBufferSize = 2048;

// Widens 7-bit text.
inline void AppendAscii(std::u16string &out, std::string_view ascii)
{
    const std::size_t start = out.size();
    out.resize(start + ascii.size());
    for (std::size_t i = 0; i < ascii.size(); ++i)
        out[start + i] = static_cast<unsigned char>(ascii[i]);
}

template <std::integral T>
void AppendDecimal(std::u16string &out, T value)
{
    char digits[24];
    const auto result = std::to_chars(digits, digits + sizeof digits, value);
    AppendAscii(out, std::string_view(digits, static_cast<std::size_t>(result.ptr - digits)));
}

// As printf's "%g", independent of the C locale.
void AppendGeneral(std::u16string &out, double value);

// Invalid sequences become U+FFFD.
void AppendUtf8(std::u16string &out, std::string_view utf8);
void AppendAsUtf8(std::string &out, std::u16string_view text);

// vsnprintf into buffer. Returns the length kept: at most kFormatBufferSize - 1
// bytes, shortened so a cut never splits a UTF-8 sequence; 0 for a failed
// format.
std::size_t FormatPrintf(char (&buffer)[kFormatBufferSize], const char *format, std::va_list args)
    __attribute__((format(printf, 2, 0)));

// The part after the last '/' or '\'.
std::string_view BaseName(std::string_view path);

} // namespace cv::util::file::log::text
