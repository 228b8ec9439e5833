#include "krn/osdep/sidaccount.h"

#include "krn/utf.h"

#include <pwd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <limits>
#include <vector>

namespace cv::krn::osdep {

namespace {

constexpr std::u16string_view kUnixUserPrefix = u"S-1-22-1-";

struct WellKnownSid
{
    std::u16string_view sid;
    std::u16string_view name;
};

constexpr WellKnownSid kWellKnownSids[] = {
    {u"S-1-1-0", u"Everyone"},
    {u"S-1-5-18", u"SYSTEM"},
};

// Plain decimal only: what a SID writer produces, nothing a lenient
// number parser would also take.
std::optional<uid_t> ParseUid(std::u16string_view digits)
{
    if (digits.empty() || digits.size() > 10 || (digits.size() > 1 && digits.front() == u'0'))
        return std::nullopt;
    std::uint64_t value = 0;
    for (const char16_t c : digits) {
        if (c < u'0' || c > u'9')
            return std::nullopt;
        value = value * 10 + std::uint64_t(c - u'0');
    }
    // (uid_t)-1 means "no user" to the system calls.
    if (value >= std::numeric_limits<std::uint32_t>::max())
        return std::nullopt;
    return uid_t(value);
}

std::optional<std::u16string> PasswdName(uid_t uid)
{
    const long suggested = ::sysconf(_SC_GETPW_R_SIZE_MAX);
    std::size_t size = suggested > 0 ? std::size_t(suggested) : 4096;
    constexpr std::size_t kMaxBuffer = 1024 * 1024;
    for (;;) {
        std::vector<char> buffer(size);
        passwd entry{};
        passwd *found = nullptr;
        const int error = ::getpwuid_r(uid, &entry, buffer.data(), buffer.size(), &found);
        if (error == ERANGE && size < kMaxBuffer) {
            size *= 2;
            continue;
        }
        if (error != 0 || !found || !found->pw_name || !*found->pw_name)
            return std::nullopt;
        return ToUtf16(found->pw_name);
    }
}

} // namespace

std::optional<std::u16string> AccountNameForSid(std::u16string_view sid)
{
    for (const WellKnownSid &known : kWellKnownSids)
        if (sid == known.sid)
            return std::u16string(known.name);
    if (!sid.starts_with(kUnixUserPrefix))
        return std::nullopt;
    const auto uid = ParseUid(sid.substr(kUnixUserPrefix.size()));
    if (!uid)
        return std::nullopt;
    return PasswdName(*uid);
}

} // namespace cv::krn::osdep
