#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace PLUGIN {

// A short text of tagged elements, "<name attr=value ...>content</name>",
// read the way the settings have always been read: one cursor moves from
// element to element, and every lookup starts again at the beginning, so the
// order of elements does not matter. An element whose closing tag is missing
// ends the scan: neither it nor anything behind it is found.
class TaggedText final
{
public:
    struct Element
    {
        std::u16string content; // blanks and tabs trimmed from both ends
        // Quotes and surrounding white space removed; a name without value
        // maps to an empty value; the first of two equal names wins.
        std::map<std::u16string, std::u16string, std::less<>> attributes;
    };

    explicit TaggedText(std::u16string_view text) : m_text(text) {}

    // The first element named exactly so (case-sensitive).
    std::optional<Element> Find(std::u16string_view name);

private:
    struct Tag
    {
        std::u16string_view name;
        std::u16string_view attributes;
        std::u16string_view content;
    };

    std::optional<Tag> Next();

    std::u16string_view m_text;
    std::size_t m_position = 0;
};

// Splits the attribute part of an opening tag into name/value pairs.
std::map<std::u16string, std::u16string, std::less<>> ParseAttributes(std::u16string_view text);

// Numbers as the C library reads them: leading white space, an optional
// sign, then the longest run of digits of the base (0: "0x" hexadecimal,
// leading "0" octal, else decimal). No digits give 0; a value out of range
// gives the extreme of the type; a minus sign negates an unsigned value
// modulo 2^32.
std::uint32_t ReadUnsigned(std::u16string_view text, int base);
std::int32_t ReadSigned(std::u16string_view text, int base);

} // namespace PLUGIN
