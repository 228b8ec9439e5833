#pragma once

#include <QString>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <string_view>
#include <vector>

namespace logtest {

inline std::string ReadBytes(const std::filesystem::path &path)
{
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

// Encodes each code unit low byte first, independently of the library.
inline std::string Utf16Le(std::u16string_view text)
{
    std::string bytes;
    for (const char16_t unit : text) {
        bytes += static_cast<char>(unit & 0xFF);
        bytes += static_cast<char>(unit >> 8);
    }
    return bytes;
}

// The file's lines as UTF-8, after the byte-order mark, split at CRLF.
inline std::vector<std::string> ReadLines(const std::filesystem::path &path)
{
    const std::string bytes = ReadBytes(path);
    std::u16string text;
    for (std::size_t i = 2; i + 1 < bytes.size(); i += 2)
        text += static_cast<char16_t>(static_cast<unsigned char>(bytes[i]) |
                                      static_cast<unsigned char>(bytes[i + 1]) << 8);
    std::vector<std::string> lines;
    std::size_t start = 0;
    for (std::size_t end; (end = text.find(u"\r\n", start)) != std::u16string::npos; start = end + 2)
        lines.push_back(QString::fromUtf16(text.data() + start, static_cast<qsizetype>(end - start)).toStdString());
    if (start < text.size())
        lines.push_back("<unterminated>" + QString::fromUtf16(text.data() + start, static_cast<qsizetype>(text.size() - start)).toStdString());
    return lines;
}

inline const std::string kBanner = "***************** New logfile section *******************";

} // namespace logtest
