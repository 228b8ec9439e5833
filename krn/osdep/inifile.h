#pragma once

#include <cstdint>
#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace cv::krn::osdep {

// A read-only INI file in UTF-8: "[section]" headers and "name=value" lines.
//
// - Section and value names match case-insensitively (Unicode case folding);
//   names and values are trimmed of surrounding blanks, values are otherwise
//   taken verbatim (quotes, backslashes and ';' inside a value are kept).
// - Lines whose first non-blank character is ';' or '#' are comments.
//   CRLF line ends and a leading byte-order mark are accepted.
// - A line that is neither is skipped. A malformed section header ("[abc")
//   is skipped together with the lines that follow it up to the next valid
//   header, so that its values never land in the section above it. Lines
//   before the first header belong to no section and are ignored.
// - A section that appears twice is merged; the first occurrence of a name
//   wins, as with the Windows profile functions.
// - A missing or unreadable file reads as an empty one.
class IniFile final
{
public:
    IniFile() = default;

    static IniFile Load(const std::filesystem::path &path);
    static IniFile Parse(std::string_view utf8Text);

    std::optional<std::u16string> Value(std::u16string_view section, std::u16string_view name) const;

    // A non-negative decimal integer (blanks around it allowed); anything
    // else, or a value too large for 32 bits, reads as missing.
    std::optional<std::uint32_t> UnsignedValue(std::u16string_view section, std::u16string_view name) const;

private:
    using Section = std::map<std::u16string, std::u16string>;

    void ParseLine(std::u16string_view line, Section *&current);

    std::map<std::u16string, Section> m_sections;
};

} // namespace cv::krn::osdep
