#pragma once

// Builds expected wire bytes field by field, little-endian, independently of
// the code under test.

#include "sorvik/bytebuffer.h"
#include "sorvik/com.h"

#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace dunemere_test {

// {01234567-89AB-CDEF-0123-456789ABCDEF}
constexpr GUID kSampleId = MakeGuid("{01234567-89AB-CDEF-0123-456789ABCDEF}");
constexpr GUID kOtherId = MakeGuid("{0A1B2C3D-4E5F-6A7B-8C9D-AEBFC0D1E2F3}");

struct Wire
{
    std::vector<std::uint8_t> bytes;

    Wire &u32(std::uint32_t v)
    {
        for (int i = 0; i < 4; ++i)
            bytes.push_back(std::uint8_t(v >> (8 * i)));
        return *this;
    }
    Wire &raw(std::string_view text)
    {
        bytes.insert(bytes.end(), text.begin(), text.end());
        return *this;
    }
    Wire &raw(std::span<const std::uint8_t> data)
    {
        bytes.insert(bytes.end(), data.begin(), data.end());
        return *this;
    }
    Wire &str(std::string_view utf8) { return u32(std::uint32_t(utf8.size())).raw(utf8); }
    Wire &guid(const GUID &g)
    {
        u32(g.Data1);
        bytes.push_back(std::uint8_t(g.Data2));
        bytes.push_back(std::uint8_t(g.Data2 >> 8));
        bytes.push_back(std::uint8_t(g.Data3));
        bytes.push_back(std::uint8_t(g.Data3 >> 8));
        bytes.insert(bytes.end(), g.Data4, g.Data4 + 8);
        return *this;
    }
};

inline std::vector<std::uint8_t> ToVector(const cv::krn::ByteBuffer &buffer)
{
    return {buffer.data(), buffer.data() + buffer.size()};
}

inline std::uint32_t ReadU32(std::span<const std::uint8_t> bytes, std::size_t offset)
{
    return std::uint32_t(bytes[offset]) | std::uint32_t(bytes[offset + 1]) << 8 |
           std::uint32_t(bytes[offset + 2]) << 16 | std::uint32_t(bytes[offset + 3]) << 24;
}

inline void WriteU32(std::vector<std::uint8_t> &bytes, std::size_t offset, std::uint32_t v)
{
    for (int i = 0; i < 4; ++i)
        bytes[offset + i] = std::uint8_t(v >> (8 * i));
}

} // namespace dunemere_test
