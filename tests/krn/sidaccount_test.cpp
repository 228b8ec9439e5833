#include "krn/osdep/sidaccount.h"

#include "krn/utf.h"

#include <gtest/gtest.h>

#include <pwd.h>
#include <unistd.h>

namespace cv::krn::osdep {
namespace {

std::u16string UnixUserSid(const std::string &uid)
{
    return u"S-1-22-1-" + ToUtf16(uid);
}

TEST(KrnSidAccount, UnixUserSidsNameTheirPasswdEntry)
{
    const passwd *self = ::getpwuid(::getuid());
    ASSERT_NE(self, nullptr);
    EXPECT_EQ(AccountNameForSid(UnixUserSid(std::to_string(::getuid()))), ToUtf16(self->pw_name));
    EXPECT_EQ(AccountNameForSid(UnixUserSid("0")), u"root");
    EXPECT_EQ(AccountNameForSid(u"S-1-1-0"), u"Everyone");
    EXPECT_EQ(AccountNameForSid(u"S-1-5-18"), u"SYSTEM");
}

TEST(KrnSidAccount, EverythingElseHasNoName)
{
    const std::u16string_view noName[] = {
        u"",
        u"S-1-22-1-",
        u"S-1-22-1-00",
        u"S-1-22-1-01",
        u"S-1-22-1-+0",
        u"S-1-22-1--1",
        u"S-1-22-1- 0",
        u"S-1-22-1-0 ",
        u"S-1-22-1-0x1",
        u"s-1-22-1-0",
        u"S-1-22-1-4294967295",  // (uid_t)-1
        u"S-1-22-1-4294967296",  // beyond 32 bits
        u"S-1-22-1-18446744073709551616",
        u"S-1-22-2-0",  // a group, not a user
        u"S-1-5-21-1004336348-1177238915-682003330-512",
        u"S-1-5-18-0",
        {u"S-1-1-0\0", 8},
    };
    for (const std::u16string_view sid : noName)
        EXPECT_EQ(AccountNameForSid(sid), std::nullopt) << ToUtf8(sid);
}

TEST(KrnSidAccount, UidWithoutPasswdEntryHasNoName)
{
    // Far above any account this machine creates.
    const uid_t unused = 3999999937u;
    if (::getpwuid(unused))
        GTEST_SKIP() << "uid " << unused << " exists here";
    EXPECT_EQ(AccountNameForSid(UnixUserSid(std::to_string(unused))), std::nullopt);
}

} // namespace
} // namespace cv::krn::osdep
