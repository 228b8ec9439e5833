#include "dunemere/utf8codec.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

using namespace cv::vek::rovo;

TEST(Utf8Codec, DecodingReplacesEachMaximalIllFormedSubsequence)
{
    struct Row
    {
        const char *name;
        std::string_view utf8;
        std::u16string_view text;
    };
    const Row rows[] = {
        {"ascii longer than one vector", "0123456789abcdefghijklmnopqrstuvwxyz", u"0123456789abcdefghijklmnopqrstuvwxyz"},
        {"two, three and four bytes", "\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80", u"\u00e9\u20ac\U0001F600"},
        {"stray continuation", "a\x80" "b", u"a\ufffdb"},
        {"invalid lead bytes", "\xC0\xC1\xF5\xFF", u"\ufffd\ufffd\ufffd\ufffd"},
        {"overlong three-byte form", "\xE0\x80\xAF", u"\ufffd\ufffd\ufffd"},
        {"encoded surrogate", "\xED\xA0\x80", u"\ufffd\ufffd\ufffd"},
        {"above U+10FFFF", "\xF4\x90\x80\x80", u"\ufffd\ufffd\ufffd\ufffd"},
        {"sequence broken by ascii", "\xE2\x82x", u"\ufffdx"},
        {"sequence cut by the end", "ab\xF0\x9F\x98", u"ab\ufffd"},
        {"non-ascii inside a vector of ascii", "0123456\xC3\xA9" "89abcdefghij", u"0123456\u00e989abcdefghij"},
    };
    for (const Row &row : rows)
        EXPECT_EQ(Utf8ToUtf16(row.utf8), row.text) << row.name;
}

TEST(Utf8Codec, PieceWiseDecodingWaitsForCutSequences)
{
    const std::string_view whole = "x\xF0\x9F\x98\x80y\xE2\x82\xAC";
    // Every split point gives the same text as decoding the whole at once.
    for (std::size_t split = 0; split <= whole.size(); ++split) {
        std::vector<char16_t> out(whole.size() * 2);
        const Utf8Progress first = DecodeUtf8(whole.substr(0, split), false, out.data());
        EXPECT_LE(split - first.consumed, 3u);
        const Utf8Progress rest = DecodeUtf8(whole.substr(first.consumed), true, out.data() + first.written);
        EXPECT_EQ(std::u16string_view(out.data(), first.written + rest.written), u"x\U0001F600y\u20ac")
            << "split at " << split;
    }
    // A lead byte that cannot start a sequence is not held back.
    char16_t out[4];
    EXPECT_EQ(DecodeUtf8("a\xFF", false, out).consumed, 2u);
}

TEST(Utf8Codec, EncodingReplacesLoneSurrogates)
{
    EXPECT_EQ(Utf16ToUtf8(u"a\u00e9\u20ac\U0001F600"), "a\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80");
    const char16_t lone[] = {u'a', 0xD800, u'b', 0xDC00, 0xD83D};
    EXPECT_EQ(Utf16ToUtf8(std::u16string_view(lone, 5)), "a\xEF\xBF\xBD" "b\xEF\xBF\xBD\xEF\xBF\xBD");
}

} // namespace
