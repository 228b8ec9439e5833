#pragma once

// Versions packed into 32 bits: major in bits 22-27, minor in 18-21, patch in
// 14-17; the low 14 bits may carry a build number.

#include <cstdint>

namespace sorvik {

constexpr std::uint32_t PackVersion(std::uint32_t major, std::uint32_t minor, std::uint32_t patch,
                                    std::uint32_t build = 0)
{
    return (major & 0x3Fu) << 22 | (minor & 0xFu) << 18 | (patch & 0xFu) << 14 | (build & 0x3FFFu);
}

constexpr std::uint32_t VersionMajor(std::uint32_t packed) { return packed >> 22 & 0x3Fu; }
constexpr std::uint32_t VersionMinor(std::uint32_t packed) { return packed >> 18 & 0xFu; }
constexpr std::uint32_t VersionPatch(std::uint32_t packed) { return packed >> 14 & 0xFu; }
constexpr std::uint32_t VersionBuild(std::uint32_t packed) { return packed & 0x3FFFu; }

// The same version without its build number, for comparisons.
constexpr std::uint32_t VersionWithoutBuild(std::uint32_t packed) { return packed & ~0x3FFFu; }

static_assert(PackVersion(18, 0, 0) == 0x4800000u);
static_assert(PackVersion(18, 0, 0, 7096) == 75504568u);

} // namespace sorvik
