#pragma once

// Conversions between the foundation wide string and QString, for the parts
// that use Qt. Both hold UTF-16, so these are plain copies.

#include "sorvik/wstring.h"

#include <QString>

#include <string_view>

namespace cv::krn {

inline QString ToQString(const WString &text)
{
    return QString::fromUtf16(text.c_str(), qsizetype(text.size()));
}

inline WString FromQString(const QString &text)
{
    return WString(reinterpret_cast<const char16_t *>(text.utf16()), std::size_t(text.size()));
}

// A view of the QString's characters, valid while the string is unchanged.
inline std::u16string_view ToView(const QString &text)
{
    return std::u16string_view(reinterpret_cast<const char16_t *>(text.utf16()), std::size_t(text.size()));
}

inline QString ToQString(std::u16string_view text)
{
    return QString::fromUtf16(text.data(), qsizetype(text.size()));
}

} // namespace cv::krn
