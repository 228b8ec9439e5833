#include "krn/utf.h"

#include <QByteArray>
#include <QString>

namespace cv::krn {

std::string ToUtf8(std::u16string_view text)
{
    const QByteArray utf8 = QString::fromUtf16(text.data(), static_cast<qsizetype>(text.size())).toUtf8();
    return std::string(utf8.constData(), static_cast<std::size_t>(utf8.size()));
}

std::u16string ToUtf16(std::string_view text)
{
    const QString wide = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
    return std::u16string(reinterpret_cast<const char16_t *>(wide.utf16()), static_cast<std::size_t>(wide.size()));
}

} // namespace cv::krn
