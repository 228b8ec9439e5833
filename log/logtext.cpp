#include "log/logtext.h"

#include <QStringDecoder>
#include <QStringEncoder>

#include <cstdio>

namespace cv::util::file::log::text {

void AppendGeneral(std::u16string &out, double value)
{
    char digits[32];
    const auto result = std::to_chars(digits, digits + sizeof digits, value, std::chars_format::general, 6);
    AppendAscii(out, std::string_view(digits, static_cast<std::size_t>(result.ptr - digits)));
}

void AppendUtf8(std::u16string &out, std::string_view utf8)
{
    // Stateless: each append stands alone. ConvertInitialBom: a leading U+FEFF
    // is text here, not a mark to drop.
    QStringDecoder decoder(QStringConverter::Utf8,
                           QStringConverter::Flag::Stateless | QStringConverter::Flag::ConvertInitialBom);
    const std::size_t start = out.size();
    out.resize(start + static_cast<std::size_t>(decoder.requiredSpace(static_cast<qsizetype>(utf8.size()))));
    QChar *const begin = reinterpret_cast<QChar *>(out.data() + start);
    const QChar *const end =
        decoder.appendToBuffer(begin, QByteArrayView(utf8.data(), static_cast<qsizetype>(utf8.size())));
    out.resize(start + static_cast<std::size_t>(end - begin));
}

void AppendAsUtf8(std::string &out, std::u16string_view text)
{
    QStringEncoder encoder(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
    const std::size_t start = out.size();
    out.resize(start + static_cast<std::size_t>(encoder.requiredSpace(static_cast<qsizetype>(text.size()))));
    char *const begin = out.data() + start;
    const char *const end = encoder.appendToBuffer(begin, QStringView(text.data(), static_cast<qsizetype>(text.size())));
    out.resize(start + static_cast<std::size_t>(end - begin));
}

std::size_t FormatPrintf(char (&buffer)[kFormatBufferSize], const char *format, std::va_list args)
{
    const int wanted = std::vsnprintf(buffer, kFormatBufferSize, format, args);
    if (wanted < 0)
        return 0;
    if (static_cast<std::size_t>(wanted) < kFormatBufferSize)
        return static_cast<std::size_t>(wanted);

    // Cut off a UTF-8 sequence that the truncation left incomplete.
    const std::size_t length = kFormatBufferSize - 1;
    std::size_t start = length;
    while (start > 0 && length - start < 3 && (static_cast<unsigned char>(buffer[start - 1]) & 0xC0) == 0x80)
        --start;
    if (start == 0)
        return length;
    const auto lead = static_cast<unsigned char>(buffer[start - 1]);
    const std::size_t needed = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : lead >= 0xC0 ? 2 : 1;
    return length - (start - 1) < needed ? start - 1 : length;
}

std::string_view BaseName(std::string_view path)
{
    const std::size_t separator = path.find_last_of("/\\");
    return separator == std::string_view::npos ? path : path.substr(separator + 1);
}

} // namespace cv::util::file::log::text
