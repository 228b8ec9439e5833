#include "dunemere/tointmsgda.h"

namespace DataCache {

namespace {

std::u16string_view BaseName(std::u16string_view path)
{
    const auto slash = path.find_last_of(u"/\\");
    if (slash != std::u16string_view::npos)
        path.remove_prefix(slash + 1);
    const auto dot = path.rfind(u'.');
    if (dot != std::u16string_view::npos && dot != 0)
        path = path.substr(0, dot);
    return path;
}

std::u16string Decimal(std::uint32_t value)
{
    const std::string digits = std::to_string(value);
    return std::u16string(digits.begin(), digits.end());
}

} // namespace

ToIntMsgDa::ToIntMsgDa(std::u16string_view sourceName, std::uint32_t position, std::uint32_t code,
                       std::u16string_view text)
    : m_code(code)
{
    m_message.append(BaseName(sourceName));
    m_message += u'(';
    m_message += Decimal(position);
    m_message += u"): ERROR(";
    m_message += Decimal(code);
    m_message += u"): ";
    m_message += text;
}

} // namespace DataCache
