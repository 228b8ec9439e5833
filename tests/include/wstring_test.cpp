#include "sorvik/wstring.h"
#include "sorvik/wstringqt.h"

#include <gtest/gtest.h>

#include <cstring>

using cv::krn::WString;

namespace {

// The three pointers as a separately compiled party sees them.
struct RawString
{
    char16_t *first;
    char16_t *last;
    char16_t *end;
};

RawString rawOf(const WString &s)
{
    RawString raw;
    std::memcpy(&raw, &s, sizeof raw);
    return raw;
}

TEST(WString, IsThreePointersOverTerminatedText)
{
    WString s(u"Parselet");
    const RawString raw = rawOf(s);
    EXPECT_EQ(raw.last - raw.first, 8);
    EXPECT_GE(raw.end, raw.last);
    EXPECT_EQ(*raw.last, u'\0');
    EXPECT_EQ(std::u16string_view(raw.first, 8), u"Parselet");

    const RawString empty = rawOf(WString());
    EXPECT_EQ(empty.first, nullptr);
    EXPECT_EQ(empty.last, nullptr);
    EXPECT_STREQ(reinterpret_cast<const char *>(WString().c_str()), "");
}

TEST(WString, CopiesMovesAndAppendsWithoutSharingStorage)
{
    WString a(u"abc");
    WString b = a;
    b += u"def";
    EXPECT_EQ(a, u"abc");
    EXPECT_EQ(b, u"abcdef");

    WString c = std::move(b);
    EXPECT_EQ(c, u"abcdef");
    EXPECT_TRUE(b.empty());

    c.clear();
    EXPECT_TRUE(c.empty());
    EXPECT_EQ(*c.c_str(), u'\0');
    c = u"again";
    EXPECT_EQ(c.size(), 5u);
}

TEST(WString, AppendsAndAssignsFromItsOwnStorage)
{
    WString s(u"ab");
    for (int i = 0; i < 6; ++i)
        s.append(s.view()); // forces growth while the source lives in the old storage
    EXPECT_EQ(s.size(), 128u);
    EXPECT_EQ(s.view().substr(0, 4), u"abab");
    EXPECT_EQ(s[127], u'b');

    s.assign(s.view().substr(1, 3));
    EXPECT_EQ(s, u"bab");
}

TEST(WString, EmbeddedNulsCountAsCharacters)
{
    const WString s(u"a\0b", 3);
    EXPECT_EQ(s.size(), 3u);
    EXPECT_EQ(s.toU16String(), std::u16string(u"a\0b", 3));
}

TEST(WString, RoundTripsThroughQStringIncludingSurrogatePairs)
{
    const std::u16string text = u"Messdaten \U0001F4C8 Grüße";
    const QString q = cv::krn::ToQString(WString(text));
    EXPECT_EQ(q.size(), qsizetype(text.size()));
    EXPECT_EQ(q, QString::fromUtf8("Messdaten \xF0\x9F\x93\x88 Grüße"));
    EXPECT_EQ(cv::krn::FromQString(q).toU16String(), text);
    EXPECT_TRUE(cv::krn::FromQString(QString()).empty());
}

} // namespace
