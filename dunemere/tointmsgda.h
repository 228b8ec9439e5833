#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace DataCache {

// The protocol client's error: a code and a message of the form
// "Source(position): ERROR(code): text".
class ToIntMsgDa
{
public:
    // sourceName may be a path: its folder and extension are dropped. The
    // position is usually the raising line.
    ToIntMsgDa(std::u16string_view sourceName, std::uint32_t position, std::uint32_t code, std::u16string_view text);
    // The same with the position defaulting to the line of the call.
    ToIntMsgDa(std::u16string_view sourceName, std::uint32_t code, std::u16string_view text,
               std::uint32_t position = __builtin_LINE())
        : ToIntMsgDa(sourceName, position, code, text)
    {
    }

    std::uint32_t Code() const noexcept { return m_code; }
    const std::u16string &Message() const noexcept { return m_message; }

private:
    std::uint32_t m_code;
    std::u16string m_message;
};

// A bare error code thrown by lower layers; the requestor turns it into a
// ToIntMsgDa carrying the same code.
enum cErrCodeDa : std::uint32_t {};

} // namespace DataCache
