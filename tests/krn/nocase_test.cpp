#include "krn/nocase.h"

#include <gtest/gtest.h>

#include <map>
#include <string>

namespace {

TEST(NoCase, IgnoresCaseBeyondAscii)
{
    using cv::krn::EqualsNoCase;
    EXPECT_TRUE(EqualsNoCase(u"D:\\Data\\Archive", u"d:\\DATA\\archive"));
    EXPECT_TRUE(EqualsNoCase(u"Ärger", u"äRGER"));
    EXPECT_FALSE(EqualsNoCase(u"Data", u"Date"));
    EXPECT_FALSE(EqualsNoCase(u"a-b", u"ab")) << "punctuation is part of a name";
    EXPECT_FALSE(EqualsNoCase(u"abc", u"ab"));
    EXPECT_TRUE(EqualsNoCase(u"", u""));
}

TEST(NoCase, PrefixComparesOnlyThePrefixLength)
{
    using cv::krn::StartsWithNoCase;
    EXPECT_TRUE(StartsWithNoCase(u"D:\\DATA\\A\\", u"d:\\data\\"));
    EXPECT_FALSE(StartsWithNoCase(u"D:\\Database\\", u"D:\\Data\\"));
    EXPECT_FALSE(StartsWithNoCase(u"D:\\", u"D:\\Data\\"));
    EXPECT_TRUE(StartsWithNoCase(u"anything", u""));
}

TEST(NoCase, OrdersMapKeysWithoutRegardToCase)
{
    std::map<std::u16string, int, cv::krn::LessNoCase> states;
    states[u"Author"] = 1;
    states[u"author"] = 2;
    states[u"Beta"] = 3;
    states[u"alpha"] = 4;
    ASSERT_EQ(states.size(), 3u);
    EXPECT_EQ(states.at(u"AUTHOR"), 2);
    EXPECT_EQ(states.begin()->first, u"alpha");
}

} // namespace
