#pragma once

// Conversions between the foundation wide string and QString, for the parts
// that use Qt. Both hold UTF-16, so these are plain copies.

#include "sorvik/wstring.h"

#include <QString>

namespace cv::krn {

inline QString ToQString(const WString &text)
{
    return QString::fromUtf16(text.c_str(), qsizetype(text.size()));
}

inline WString FromQString(const QString &text)
{
    return WString(reinterpret_cast<const char16_t *>(text.utf16()), std::size_t(text.size()));
}

} // namespace cv::krn
