#pragma once

// The path argument of the search-area subcommands as the module takes it.

#include "sorvik/wstring.h"

#include <QString>

namespace host {

inline cv::krn::WString ToWString(const QString &text)
{
    return cv::krn::WString(reinterpret_cast<const char16_t *>(text.utf16()), std::size_t(text.size()));
}

} // namespace host
