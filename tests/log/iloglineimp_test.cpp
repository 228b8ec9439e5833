#include "log/iloglineimp.h"
#include "log/ilogout.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <climits>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

using namespace cv::util::file::log;

class RecordingGlob final : public ILogGlob
{
public:
    void WriteLine(std::u16string_view text, LineKind kind, std::uint32_t verbosity) override
    {
        offered.emplace_back(text);
        if (fail)
            throw std::runtime_error("sink failed");
        lines.emplace_back(text);
        kinds.push_back(kind);
        verbosities.push_back(verbosity);
    }
    std::u16string_view LineEnd() const override { return u"\r\n"; }

    bool fail = false;
    std::vector<std::u16string> offered; // written or not
    std::vector<std::u16string> lines;
    std::vector<LineKind> kinds;
    std::vector<std::uint32_t> verbosities;
};

class LogLineTest : public ::testing::Test
{
protected:
    ILogOut NewLine() { return ILogOut(new ILogLineImp(m_glob, LineKind::Info, 7, u"> ")); }
    // The one line written so far.
    std::u16string Written() const { return m_glob.lines.size() == 1 ? m_glob.lines[0] : u"<none or several>"; }

    RecordingGlob m_glob;
};

TEST_F(LogLineTest, NumbersKeepTheirFullWidth)
{
    NewLine() << LLONG_MIN << ' ' << ULLONG_MAX << ' ' << static_cast<unsigned char>(255) << ' '
              << static_cast<unsigned short>(65535) << ' ' << UINT_MAX << ' ' << ULONG_MAX << ' '
              << static_cast<signed char>(-128) << ' ' << static_cast<short>(-32768) << ' ' << INT_MIN << ' '
              << LONG_MIN << ' ' << true;
    EXPECT_EQ(Written(), u"> -9223372036854775808 18446744073709551615 255 65535 4294967295 18446744073709551615 "
                         u"-128 -32768 -2147483648 -9223372036854775808 1");
}

TEST_F(LogLineTest, FloatingValuesFollowPercentG)
{
    NewLine() << 1.5f << ' ' << 0.1f << ' ' << 1e20 << ' ' << 123456789.0 << ' ' << 0.0001 << ' ' << -0.0;
    EXPECT_EQ(Written(), u"> 1.5 0.1 1e+20 1.23457e+08 0.0001 -0");
}

TEST_F(LogLineTest, TextIsConvertedToUtf16)
{
    const char *noText = nullptr;
    const char16_t *noWideText = nullptr;
    NewLine() << "\xC3\xA4" << u"\u00DF" << noText << noWideText << std::string("s") << std::u16string(u"w") << 'c'
              << u'\u00FC' << "bad\xFF";
    EXPECT_EQ(Written(), u"> \u00E4\u00DFswc\u00FCbad\uFFFD");
}

TEST_F(LogLineTest, PrintfStyleKeepsAtMost2047Bytes)
{
    const std::string long_(3000, 'x');
    ILogLine *line = new ILogLineImp(m_glob, LineKind::Warning, 0);
    line->AppendFormat("%s", long_.c_str());
    line->Release();
    ASSERT_EQ(m_glob.lines.size(), 1u);
    EXPECT_EQ(m_glob.lines[0], std::u16string(2047, u'x'));

    // A cut through a multi-byte character drops the whole character.
    m_glob.lines.clear();
    NewLine().Format("%s\xC3\xA9", std::string(2046, 'y').c_str());
    EXPECT_EQ(Written(), u"> " + std::u16string(2046, u'y'));
}

TEST_F(LogLineTest, PrintfStyleFormatsAndEndsLines)
{
    const char *noFormat = nullptr; // as a variable format may be
    ILogLine *line = new ILogLineImp(m_glob, LineKind::Warning, 0);
    line->AppendFormat("%s-%d|", "a", 5);
    line->AppendFormatLine("n=%u", 3u);
    line->AppendFormat(noFormat, 0);
    line->Release();
    NewLine().Format("%05.1f", 2.25).FormatLine("%c", 'z').Format(noFormat, 0);
    EXPECT_THAT(m_glob.lines, ::testing::ElementsAre(u"a-5|n=3\r\n", u"> 002.2z\r\n"));
}

TEST_F(LogLineTest, TheLineIsWrittenOnceWhenTheLastHandleGoes)
{
    ILogOut first = NewLine();
    {
        ILogOut copy = first;
        ILogOut moved = std::move(copy);
        moved << "a";
        EXPECT_FALSE(copy);
    }
    EXPECT_TRUE(m_glob.lines.empty());
    first << "b";
    first = ILogOut();
    EXPECT_FALSE(first);
    EXPECT_EQ(Written(), u"> ab");
    EXPECT_EQ(m_glob.kinds[0], LineKind::Info);
    EXPECT_EQ(m_glob.verbosities[0], 7u);
}

TEST_F(LogLineTest, AnEmptyHandleIgnoresAppends)
{
    ILogOut none;
    none << 1 << "x" << u"y" << 2.0;
    none.Format("%d", 1).FormatLine("%d", 2);
    EXPECT_FALSE(none);

    // A handle emptied by a move no longer reaches the line it held.
    ILogOut line = NewLine();
    ILogOut moved = std::move(line);
    line << 1 << "x" << u"y" << 2.0;
    line.Format("%d", 1).FormatLine("%d", 2);
    moved << "kept";
    moved = ILogOut();
    EXPECT_EQ(Written(), u"> kept");
}

TEST_F(LogLineTest, AFailingSinkStillFreesTheLine)
{
    m_glob.fail = true;
    ILogLine *line = new ILogLineImp(m_glob, LineKind::Error, 0, u"x");
    EXPECT_THROW(line->Release(), std::runtime_error);
    // The handle's destructor swallows the failure instead of terminating.
    EXPECT_NO_THROW(NewLine() << "lost");
    EXPECT_THAT(m_glob.offered, ::testing::ElementsAre(u"x", u"> lost")) << "both lines reached the failing sink";
    EXPECT_TRUE(m_glob.lines.empty());
}

} // namespace
