#pragma once

// Counted wide strings as hosts know them: a 32-bit byte length stored just in
// front of the characters, which are UTF-16 and NUL-terminated. A BSTR points
// at the first character. Allocated and freed only through these functions.

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>

using BSTR = char16_t *;

inline BSTR SysAllocStringLen(const char16_t *text, std::uint32_t length)
{
    constexpr std::uint32_t maxLength = (std::numeric_limits<std::uint32_t>::max() - 8) / 2;
    if (length > maxLength)
        return nullptr;
    const std::uint32_t bytes = length * 2;
    auto *block = static_cast<unsigned char *>(std::malloc(sizeof(std::uint32_t) + bytes + 2));
    if (!block)
        return nullptr;
    std::memcpy(block, &bytes, sizeof bytes);
    auto *chars = reinterpret_cast<char16_t *>(block + sizeof(std::uint32_t));
    if (text)
        std::memcpy(chars, text, bytes);
    else
        std::memset(chars, 0, bytes);
    chars[length] = u'\0';
    return chars;
}

inline BSTR SysAllocString(const char16_t *text)
{
    if (!text)
        return nullptr;
    std::uint32_t length = 0;
    while (text[length])
        ++length;
    return SysAllocStringLen(text, length);
}

inline std::uint32_t SysStringByteLen(const char16_t *text)
{
    if (!text)
        return 0;
    std::uint32_t bytes;
    std::memcpy(&bytes, reinterpret_cast<const unsigned char *>(text) - sizeof bytes, sizeof bytes);
    return bytes;
}

inline std::uint32_t SysStringLen(const char16_t *text)
{
    return SysStringByteLen(text) / 2;
}

inline void SysFreeString(BSTR text)
{
    if (text)
        std::free(reinterpret_cast<unsigned char *>(text) - sizeof(std::uint32_t));
}
