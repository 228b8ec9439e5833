#include "dunemere/taggedtext.h"

#include <limits>

namespace PLUGIN {

namespace {

bool IsBlankOrTab(char16_t c)
{
    return c == u' ' || c == u'\t';
}

bool IsWhiteSpace(char16_t c)
{
    return c == u' ' || c == u'\t' || c == u'\n' || c == u'\r';
}

bool IsQuote(char16_t c)
{
    return c == u'"' || c == u'\'';
}

template <typename Predicate>
std::u16string_view Trim(std::u16string_view text, Predicate isSpace)
{
    while (!text.empty() && isSpace(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && isSpace(text.back()))
        text.remove_suffix(1);
    return text;
}

std::u16string CleanValue(std::u16string_view value)
{
    value = Trim(value, IsWhiteSpace);
    if (!value.empty() && IsQuote(value.front())) {
        const char16_t quote = value.front();
        value.remove_prefix(1);
        if (!value.empty() && value.back() == quote)
            value.remove_suffix(1);
    }
    return std::u16string(value);
}

int DigitValue(char16_t c)
{
    if (c >= u'0' && c <= u'9')
        return c - u'0';
    if (c >= u'a' && c <= u'z')
        return c - u'a' + 10;
    if (c >= u'A' && c <= u'Z')
        return c - u'A' + 10;
    return 99;
}

bool IsNumberSpace(char16_t c)
{
    return c == u' ' || (c >= u'\t' && c <= u'\r');
}

// The magnitude of a number text; overflow is set when it exceeds limit.
struct Magnitude
{
    bool negative = false;
    bool overflow = false;
    std::uint64_t value = 0;
};

Magnitude ReadMagnitude(std::u16string_view text, int base, std::uint64_t limit)
{
    Magnitude result;
    std::size_t i = 0;
    while (i < text.size() && IsNumberSpace(text[i]))
        ++i;
    if (i < text.size() && (text[i] == u'+' || text[i] == u'-')) {
        result.negative = text[i] == u'-';
        ++i;
    }
    const bool hexPrefix = i + 2 < text.size() && text[i] == u'0' && (text[i + 1] == u'x' || text[i + 1] == u'X')
        && DigitValue(text[i + 2]) < 16;
    if (base == 0)
        base = hexPrefix ? 16 : (i < text.size() && text[i] == u'0') ? 8 : 10;
    if (base == 16 && hexPrefix)
        i += 2;
    for (; i < text.size(); ++i) {
        const int digit = DigitValue(text[i]);
        if (digit >= base)
            break;
        if (!result.overflow) {
            result.value = result.value * std::uint64_t(base) + std::uint64_t(digit);
            if (result.value > limit)
                result.overflow = true;
        }
    }
    return result;
}

} // namespace

std::optional<TaggedText::Tag> TaggedText::Next()
{
    const std::size_t open = m_text.find(u'<', m_position);
    if (open == std::u16string_view::npos)
        return std::nullopt;
    const std::size_t close = m_text.find(u'>', open + 1);
    if (close == std::u16string_view::npos)
        return std::nullopt;

    const std::u16string_view tag = m_text.substr(open + 1, close - open - 1);
    std::size_t nameEnd = 0;
    while (nameEnd < tag.size() && !IsWhiteSpace(tag[nameEnd]))
        ++nameEnd;
    const std::u16string_view name = tag.substr(0, nameEnd);

    std::u16string closingTag = u"</";
    closingTag += name;
    closingTag += u'>';
    const std::size_t closing = m_text.find(closingTag, close + 1);
    if (closing == std::u16string_view::npos)
        return std::nullopt;

    m_position = closing + closingTag.size();
    return Tag{name, tag.substr(nameEnd), Trim(m_text.substr(close + 1, closing - close - 1), IsBlankOrTab)};
}

std::optional<TaggedText::Element> TaggedText::Find(std::u16string_view name)
{
    m_position = 0;
    while (const std::optional<Tag> tag = Next()) {
        if (tag->name == name)
            return Element{std::u16string(tag->content), ParseAttributes(tag->attributes)};
    }
    return std::nullopt;
}

std::map<std::u16string, std::u16string, std::less<>> ParseAttributes(std::u16string_view text)
{
    std::map<std::u16string, std::u16string, std::less<>> attributes;
    std::size_t i = 0;
    while (i < text.size()) {
        while (i < text.size() && IsWhiteSpace(text[i]))
            ++i;
        if (i == text.size())
            break;
        // One pair runs to the next white space outside quotes.
        const std::size_t start = i;
        char16_t quote = 0;
        for (; i < text.size(); ++i) {
            const char16_t c = text[i];
            if (quote) {
                if (c == quote)
                    quote = 0;
            } else if (IsQuote(c)) {
                quote = c;
            } else if (IsWhiteSpace(c)) {
                break;
            }
        }
        const std::u16string_view pair = text.substr(start, i - start);
        const std::size_t equals = pair.find(u'=');
        const std::u16string_view name = Trim(pair.substr(0, equals), IsWhiteSpace);
        const std::u16string value = equals == std::u16string_view::npos ? std::u16string() : CleanValue(pair.substr(equals + 1));
        attributes.emplace(std::u16string(name), value);
    }
    return attributes;
}

std::uint32_t ReadUnsigned(std::u16string_view text, int base)
{
    const Magnitude number = ReadMagnitude(text, base, std::numeric_limits<std::uint32_t>::max());
    if (number.overflow)
        return std::numeric_limits<std::uint32_t>::max();
    const auto value = static_cast<std::uint32_t>(number.value);
    return number.negative ? static_cast<std::uint32_t>(0u - value) : value;
}

std::int32_t ReadSigned(std::u16string_view text, int base)
{
    const std::uint64_t limit = std::uint64_t(std::numeric_limits<std::int32_t>::max()) + 1;
    const Magnitude number = ReadMagnitude(text, base, limit);
    if (number.negative) {
        if (number.overflow)
            return std::numeric_limits<std::int32_t>::min();
        return static_cast<std::int32_t>(-static_cast<std::int64_t>(number.value));
    }
    if (number.overflow || number.value == limit)
        return std::numeric_limits<std::int32_t>::max();
    return static_cast<std::int32_t>(number.value);
}

} // namespace PLUGIN
