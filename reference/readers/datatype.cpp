#include "reference/readers/datatype.h"

#include <QDate>

#include <charconv>

namespace sorvik::readers {

namespace {

bool IsDigit(char c)
{
    return c >= '0' && c <= '9';
}

// Skips digits from at; returns how many there were.
std::size_t Digits(std::string_view text, std::size_t &at)
{
    const std::size_t start = at;
    while (at < text.size() && IsDigit(text[at]))
        ++at;
    return at - start;
}

bool IsInteger(std::string_view text)
{
    std::size_t at = (!text.empty() && (text[0] == '+' || text[0] == '-')) ? 1 : 0;
    return Digits(text, at) > 0 && at == text.size();
}

bool FitsInteger(std::string_view text)
{
    if (!text.empty() && text[0] == '+')
        text.remove_prefix(1);
    std::int64_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    return error == std::errc() && end == text.data() + text.size();
}

// [+-] (digits [. digits] | . digits) [(e|E) [+-] digits]
bool IsNumeric(std::string_view text)
{
    std::size_t at = (!text.empty() && (text[0] == '+' || text[0] == '-')) ? 1 : 0;
    std::size_t mantissa = Digits(text, at);
    if (at < text.size() && text[at] == '.') {
        ++at;
        mantissa += Digits(text, at);
    }
    if (mantissa == 0)
        return false;
    if (at < text.size() && (text[at] == 'e' || text[at] == 'E')) {
        ++at;
        if (at < text.size() && (text[at] == '+' || text[at] == '-'))
            ++at;
        if (Digits(text, at) == 0)
            return false;
    }
    return at == text.size();
}

// Exactly count digits at at, as a number.
bool Fixed(std::string_view text, std::size_t &at, std::size_t count, int &value)
{
    if (at + count > text.size())
        return false;
    value = 0;
    for (std::size_t i = 0; i < count; ++i) {
        const char c = text[at + i];
        if (!IsDigit(c))
            return false;
        value = value * 10 + (c - '0');
    }
    at += count;
    return true;
}

bool Expect(std::string_view text, std::size_t &at, char c)
{
    if (at >= text.size() || text[at] != c)
        return false;
    ++at;
    return true;
}

bool IsTime(std::string_view text)
{
    std::size_t at = 0;
    int year, month, day, hour, minute, second = 0;
    if (!Fixed(text, at, 4, year) || !Expect(text, at, '-') || !Fixed(text, at, 2, month) || !Expect(text, at, '-') ||
        !Fixed(text, at, 2, day) || !Expect(text, at, 'T') || !Fixed(text, at, 2, hour) || !Expect(text, at, ':') ||
        !Fixed(text, at, 2, minute))
        return false;
    if (at < text.size() && text[at] == ':') {
        ++at;
        if (!Fixed(text, at, 2, second))
            return false;
        if (at < text.size() && (text[at] == '.' || text[at] == ',')) {
            ++at;
            if (Digits(text, at) == 0)
                return false;
        }
    }
    if (at < text.size() && text[at] == 'Z') {
        ++at;
    } else if (at < text.size() && (text[at] == '+' || text[at] == '-')) {
        ++at;
        int offsetHours, offsetMinutes = 0;
        if (!Fixed(text, at, 2, offsetHours) || offsetHours > 23)
            return false;
        if (at < text.size() && text[at] == ':')
            ++at;
        if (at < text.size() && (!Fixed(text, at, 2, offsetMinutes) || offsetMinutes > 59))
            return false;
    }
    return at == text.size() && QDate::isValid(year, month, day) && hour <= 23 && minute <= 59 && second <= 59;
}

} // namespace

DataType Classify(std::string_view value)
{
    if (IsInteger(value))
        return FitsInteger(value) ? DataType::Integer : DataType::Numeric;
    if (IsNumeric(value))
        return DataType::Numeric;
    if (IsTime(value))
        return DataType::Time;
    return DataType::String;
}

DataType Combine(DataType a, DataType b)
{
    if (a == b)
        return a;
    const bool aNumber = a == DataType::Integer || a == DataType::Numeric;
    const bool bNumber = b == DataType::Integer || b == DataType::Numeric;
    return aNumber && bNumber ? DataType::Numeric : DataType::String;
}

} // namespace sorvik::readers
