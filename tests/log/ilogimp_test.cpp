#include "log/ilogimp.h"

#include "logfilereader.h"
#include "support/tempdir.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <tuple>

#include <sys/stat.h>
#include <unistd.h>

namespace {

using namespace cv::util::file::log;
using logtest::kBanner;
using logtest::ReadBytes;
using logtest::ReadLines;
using logtest::Utf16Le;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class LogFileTest : public ::testing::Test
{
protected:
    std::filesystem::path Path(const char *name) const { return m_dir.file(name); }
    std::u16string Name(const char *name) const { return Path(name).u16string(); }

private:
    testsupport::TempDir m_dir;
};

TEST_F(LogFileTest, NewFileHasMarkBannerAndUtf16LeLines)
{
    {
        ILogImp log(Name("a.log"));
        EXPECT_EQ(log.GetOutputFlags(), kOutputFile);
        log.Warning(__FILE__, __LINE__) << "gr\xC3\xB6\xC3\x9F" "e " << 42 << u" \U0001D11E";
        log.FatalError(nullptr, 0) << "x";
    }
    const std::string bytes = ReadBytes(Path("a.log"));
    EXPECT_EQ(bytes.substr(0, 6), std::string("\xFF\xFE*\0*\0", 6));
    EXPECT_EQ(bytes, "\xFF\xFE" + Utf16Le(u"***************** New logfile section *******************\r\n") +
                         Utf16Le(u"DSA: Warning: gr\u00F6\u00DFe 42 \U0001D11E\r\n") +
                         Utf16Le(u"DSA: FATALERROR: x\r\n"));
    // The surrogate pair of U+1D11E, low byte first.
    EXPECT_NE(bytes.find(std::string("\x34\xD8\x1E\xDD", 4)), std::string::npos);
}

TEST_F(LogFileTest, ReopeningContinuesTheFileWithANewSection)
{
    { std::ofstream empty(Path("a.log")); }
    {
        ILogImp log(Name("a.log"));
        log.Warning(nullptr, 0) << "first";
        log.CloseFile();
        log.Error(nullptr, 0) << "second";
    }
    ILogImp log(Name("a.log"));
    log.Warning(nullptr, 0) << "third";
    log.CloseFile();

    // An existing empty file gets the mark; later openings never repeat it.
    const std::string bytes = ReadBytes(Path("a.log"));
    EXPECT_EQ(bytes.substr(0, 2), "\xFF\xFE");
    EXPECT_EQ(bytes.find("\xFF\xFE", 2), std::string::npos);
    EXPECT_THAT(ReadLines(Path("a.log")), ElementsAre(kBanner, "DSA: Warning: first", kBanner, "DSA: ERROR: second",
                                                      kBanner, "DSA: Warning: third"));
}

TEST_F(LogFileTest, PastTheMaximumWritingGoesOnJustBehindTheMark)
{
    ILogImp log(Name("a.log"));
    log.SetMaxFileSize(1);
    EXPECT_EQ(log.GetMaxFileSize(), 1u);
    const std::string padding(80, '.');

    std::string before;
    for (int i = 0; before.size() <= 1024; ++i) {
        log.Warning(nullptr, 0) << i << padding;
        const std::string now = ReadBytes(Path("a.log"));
        ASSERT_GT(now.size(), before.size()) << "wrapped too early at line " << i;
        before = now;
    }

    const std::string wrapped = Utf16Le(u"DSA: Warning: wrapped\r\n");
    log.Warning(nullptr, 0) << "wrapped";
    const std::string after = ReadBytes(Path("a.log"));
    ASSERT_EQ(after.size(), before.size());
    EXPECT_EQ(after.substr(0, 2), "\xFF\xFE");
    EXPECT_EQ(after.substr(2, wrapped.size()), wrapped);
    EXPECT_EQ(after.substr(2 + wrapped.size()), before.substr(2 + wrapped.size()));

    // The count restarted at the new position, so the next line follows on.
    log.Warning(nullptr, 0) << "next";
    const std::string next = Utf16Le(u"DSA: Warning: next\r\n");
    EXPECT_EQ(ReadBytes(Path("a.log")).substr(2 + wrapped.size(), next.size()), next);
}

TEST_F(LogFileTest, InfoMaskSelectsVerbositiesModulo32)
{
    ILogImp log(Name("a.log"), 0x20);
    log.Info(nullptr, 0, 5) << "five";
    log.SetInfoMask(0x10);
    EXPECT_EQ(log.GetInfoMask(), 0x10u);
    EXPECT_FALSE(log.Info(nullptr, 0, 5));
    log.Info(nullptr, 0, 5) << "hidden";
    log.Warning(nullptr, 0) << "shown";
    log.Info(nullptr, 0, 4) << "four";
    log.Info(nullptr, 0, 36) << "thirty-six";
    log.Info(nullptr, 0, 100) << "hundred";
    log.CloseFile();

    EXPECT_THAT(ReadLines(Path("a.log")),
                ElementsAre(kBanner, "DSA: Info(05): five", "DSA: Warning: shown", "DSA: Info(04): four",
                            "DSA: Info(36): thirty-six", "DSA: Info(100): hundred"));
    EXPECT_EQ(log.GetWarningCount(), 1u);
    EXPECT_EQ(log.GetErrorCount(), 0u);
}

TEST_F(LogFileTest, WithoutAnOutputChannelNothingIsWrittenButCallsCount)
{
    ILogImp log(Name("a.log"), 0xFFFFFFFF);
    log.SetOutputFlags(kOutputElapsedTime | kOutputSourcePosition);
    EXPECT_FALSE(log.FatalError(nullptr, 0));
    EXPECT_FALSE(log.Error(nullptr, 0));
    EXPECT_FALSE(log.Warning(nullptr, 0));
    EXPECT_FALSE(log.Info(nullptr, 0, 1));
    EXPECT_FALSE(std::filesystem::exists(Path("a.log")));
    EXPECT_EQ(log.GetErrorCount(), 2u);
    EXPECT_EQ(log.GetWarningCount(), 1u);

    log.SetOutputFlags(kOutputFile);
    log.Error(nullptr, 0) << "e";
    EXPECT_EQ(log.GetErrorCount(), 3u);
    EXPECT_THAT(ReadLines(Path("a.log")), ElementsAre(kBanner, "DSA: ERROR: e"));
}

TEST(LogFlags, SetOutputFlagsKeepsTheSwitchBitAndTheFileBitFollowsTheName)
{
    ILogImp log;
    EXPECT_EQ(log.GetOutputFlags(), 0u);
    log.SetFileName(u"/nonexistent/a.log");
    EXPECT_EQ(log.GetOutputFlags(), kOutputFile);
    log.SetFileName(u"");
    EXPECT_EQ(log.GetOutputFlags(), 0u);

    log.SwitchOn(0x7);
    EXPECT_EQ(log.GetInfoMask(), 0x7u);
    log.SetOutputFlags(kOutputConsole);
    EXPECT_EQ(log.GetOutputFlags(), kOutputConsole | kOutputAdditionalSwitch);
    log.SwitchOff();
    EXPECT_EQ(log.GetInfoMask(), 0u);
    EXPECT_EQ(log.GetOutputFlags(), kOutputConsole);
    log.SetOutputFlags(kOutputAdditionalSwitch | kOutputDebugger);
    EXPECT_EQ(log.GetOutputFlags(), kOutputDebugger);
}

TEST_F(LogFileTest, PrefixesGiveElapsedTimeAndSourceBaseName)
{
    ILogImp log(Name("a.log"), 0x1);
    log.SetOutputFlags(kOutputFile | kOutputElapsedTime | kOutputSourcePosition);
    log.Warning("/src/dunemere/requestor.cpp", 12) << "a";
    log.Info("C:\\src\\dunemere\\comm.cpp", 7, 0) << "b";
    log.Error(nullptr, 3) << "c";
    log.SetOutputFlags(kOutputFile | kOutputSourcePosition);
    log.FatalError("plain.cpp", -1) << "d";
    log.FatalError("", 5) << "e";
    log.CloseFile();

    EXPECT_THAT(ReadLines(Path("a.log")),
                ElementsAre(kBanner, MatchesRegex(R"(T=[0-9]+s: requestor\.cpp\(12\): DSA: Warning: a)"),
                            MatchesRegex(R"(T=[0-9]+s: comm\.cpp\(7\): DSA: Info\(00\): b)"),
                            MatchesRegex(R"(T=[0-9]+s: DSA: ERROR: c)"), "plain.cpp(-1): DSA: FATALERROR: d",
                            "DSA: FATALERROR: e"));
}

TEST(LogReceiver, GetsKindVerbosityAndTextWhileEitherAdditionalBitIsSet)
{
    std::vector<std::tuple<LineKind, std::uint32_t, std::u16string>> received;
    ILogImp log({}, 0x1, [&](LineKind kind, std::uint32_t verbosity, std::u16string_view text) {
        received.emplace_back(kind, verbosity, text);
    });
    log.SetOutputFlags(kOutputDebugger);
    log.Warning(nullptr, 0) << "not passed on";
    log.SetOutputFlags(kOutputAdditional);
    log.Warning(nullptr, 0) << "w";
    log.Info(nullptr, 0, 0).FormatLine("%d", 1);
    log.SetOutputFlags(0);
    log.SwitchOn(0x8);
    log.Info(nullptr, 0, 3) << "i";
    EXPECT_FALSE(log.Info(nullptr, 0, 0));
    log.SwitchOff();
    EXPECT_FALSE(log.Warning(nullptr, 0));

    EXPECT_THAT(received, ElementsAre(std::tuple(LineKind::Warning, 0u, u"DSA: Warning: w"),
                                      std::tuple(LineKind::Info, 0u, u"DSA: Info(00): 1\r\n"),
                                      std::tuple(LineKind::Info, 3u, u"DSA: Info(03): i")));
}

TEST(LogReceiver, MayWriteToItsOwnLog)
{
    ILogImp *self = nullptr;
    int calls = 0;
    ILogImp log({}, 0, [&](LineKind kind, std::uint32_t, std::u16string_view) {
        ++calls;
        if (kind == LineKind::Error)
            self->Warning(nullptr, 0) << "echo";
    });
    self = &log;
    log.SetOutputFlags(kOutputAdditional);
    log.Error(nullptr, 0) << "e";
    EXPECT_EQ(calls, 2);
}

TEST_F(LogFileTest, SameNameKeepsTheFileOpenAnotherNameClosesIt)
{
    ILogImp log(Name("a.log"));
    log.Warning(nullptr, 0) << "one";
    std::filesystem::rename(Path("a.log"), Path("moved.log"));
    log.SetFileName(Name("a.log"));
    log.Warning(nullptr, 0) << "two";
    EXPECT_FALSE(std::filesystem::exists(Path("a.log")));

    log.SetFileName(Name("b.log"));
    log.Warning(nullptr, 0) << "three";
    EXPECT_THAT(ReadLines(Path("moved.log")), ElementsAre(kBanner, "DSA: Warning: one", "DSA: Warning: two"));
    EXPECT_THAT(ReadLines(Path("b.log")), ElementsAre(kBanner, "DSA: Warning: three"));

    log.DeleteFile();
    EXPECT_FALSE(std::filesystem::exists(Path("b.log")));
    log.Warning(nullptr, 0) << "four";
    EXPECT_THAT(ReadLines(Path("b.log")), ElementsAre(kBanner, "DSA: Warning: four"));
}

TEST_F(LogFileTest, AFileThatCannotBeOpenedIsTriedAgainByTheNextLine)
{
    ILogImp log(Name("later/a.log"));
    log.Warning(nullptr, 0) << "lost";
    std::filesystem::create_directory(Path("later"));
    log.Warning(nullptr, 0) << "kept";
    EXPECT_THAT(ReadLines(Path("later/a.log")), ElementsAre(kBanner, "DSA: Warning: kept"));
}

TEST_F(LogFileTest, ASecondWriterGetsNothingWhileTheFirstHoldsTheFile)
{
    auto first = std::make_unique<ILogImp>(Name("a.log"));
    ILogImp second(Name("a.log"));
    first->Warning(nullptr, 0) << "first";
    second.Warning(nullptr, 0) << "refused";
    first.reset();
    second.Warning(nullptr, 0) << "second";
    second.CloseFile();
    EXPECT_THAT(ReadLines(Path("a.log")), ElementsAre(kBanner, "DSA: Warning: first", kBanner, "DSA: Warning: second"));
}

TEST(LogFileName, CapacityCountsTheTerminator)
{
    ILogImp log(u"abc");
    char16_t buffer[8] = {u'#', u'#', u'#', u'#', u'#', u'#', u'#', u'#'};
    EXPECT_TRUE(log.GetFileName(buffer, 4));
    EXPECT_EQ(std::u16string(buffer), u"abc");

    std::fill(std::begin(buffer), std::end(buffer), u'#');
    EXPECT_FALSE(log.GetFileName(buffer, 3));
    EXPECT_EQ(buffer[0], u'\0');
    EXPECT_EQ(buffer[1], u'#');
    buffer[0] = u'#';
    EXPECT_FALSE(log.GetFileName(buffer, 0));
    EXPECT_EQ(buffer[0], u'#');
    EXPECT_FALSE(log.GetFileName(nullptr, 8));
}

TEST_F(LogFileTest, ConsoleGetsUtf8Lines)
{
    std::fflush(stdout);
    const int saved = ::dup(STDOUT_FILENO);
    {
        std::FILE *capture = std::fopen(Path("console.txt").c_str(), "w");
        ASSERT_NE(capture, nullptr);
        ::dup2(::fileno(capture), STDOUT_FILENO);
        std::fclose(capture);
    }
    ILogImp log;
    log.SetOutputFlags(kOutputConsole);
    log.Error(nullptr, 0) << u"h\u00E9llo";
    log.Flush();
    ::dup2(saved, STDOUT_FILENO);
    ::close(saved);
    EXPECT_EQ(ReadBytes(Path("console.txt")), "DSA: ERROR: h\xC3\xA9llo\n");
}

} // namespace

namespace {

unsigned PermissionsOf(const std::filesystem::path &path)
{
    struct stat status = {};
    EXPECT_EQ(::stat(path.c_str(), &status), 0);
    return status.st_mode & 0777;
}

TEST_F(LogFileTest, LogFilesAreReadableByTheirOwnerOnly)
{
    {
        ILogImp log(Name("new.log"));
        log.Warning(__FILE__, __LINE__) << "line";
    }
    EXPECT_EQ(PermissionsOf(Path("new.log")), 0600u);

    // A file that others could read before is closed to them once written to.
    std::ofstream(Path("old.log")) << "";
    ASSERT_EQ(::chmod(Path("old.log").c_str(), 0644), 0);
    {
        ILogImp log(Name("old.log"));
        log.Warning(__FILE__, __LINE__) << "line";
    }
    EXPECT_EQ(PermissionsOf(Path("old.log")), 0600u);
}

} // namespace
