// The reference server indexing folders a test generates: what it counts,
// what it leaves out, when it indexes, and what it does with files that
// time out, fail or are anything but well-formed.

#include "indexingfixture.h"

#include "support/directstoreaccessref.h"

#include "dunemere/directstoreaccess.h"

#include <gtest/gtest.h>

#include <signal.h>
#include <sys/stat.h>

#include <fstream>

namespace {

using namespace reftest;
namespace status = cv::rovo::status;

[[maybe_unused]] const bool g_registry = (InstallServerRegistry(), true);

class IndexingProcessTest : public IndexingTest
{
protected:
    // Five files of both formats in three folders, and two no reader takes.
    void WriteMix()
    {
        Write("a.csv", CsvText({"operator = Ada"}, {"time", "speed"}));
        Write("sub/b.csv", CsvText({}, {"time", "speed", "temp"}));
        Write("sub/deeper/c.txt", CsvText({}, {"t", "u", "v", "w"}));
        Write("d.asc", TextTableText({"title: Run"}, {"x", "y", "z"}));
        Write("e.prn", TextTableText({}, {"x", "y"}));
        Write("song.wav", "RIFF");
        Write("notes.md", "# not a table\n");
    }
    static constexpr ElementCounts kMix{5, 5, 14};
};

TEST_F(IndexingProcessTest, ElementCountsAreExactForAMixOfCsvAndTextTableFiles)
{
    WriteMix();
    IndexData();
    auto server = StartIndexing();
    EXPECT_EQ(Counts(), kMix);
    EXPECT_EQ(Failures(), 0);
    EXPECT_EQ(Timeouts(), 0u);
    EXPECT_EQ(StatusValue("SELECT count(*) FROM files WHERE path LIKE '%song.wav'"), 0)
        << "WaveAudio has no reader in this server";

    // Files that change or go are read again or leave the index.
    std::filesystem::remove(Data("sub/b.csv"));
    Write("a.csv", CsvText({}, {"time", "speed", "more"}));
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Counts(), (ElementCounts{4, 4, 12}));
}

TEST_F(IndexingProcessTest, AnExcludedFolderAndASwitchedOffParseletLeaveTheirFilesOut)
{
    WriteMix();
    IndexData();
    auto server = StartIndexing();
    ASSERT_EQ(Counts(), kMix);

    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        const WString sub(U16(Data("sub").string()));
        WString kept;
        OkVoid([&](std::int32_t *status) { editor->AddFolder(&kept, sub, sub, WString(u"sub"), 0, 1, WString(), status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Counts(), (ElementCounts{3, 3, 7})) << "a.csv, d.asc and e.prn";

    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetParseletActive(WString(u"TextTable"), 0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 2})) << "a.csv alone";

    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetParseletActive(WString(u"TextTable"), 1, status); });
        OkVoid([&](std::int32_t *status) { editor->RemoveFolder(WString(U16(Data("sub").string())), 1, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Counts(), kMix);
}

TEST_F(IndexingProcessTest, APriorityChangeMakesTxtFilesReadByTheOtherReader)
{
    // A TextTable file: as CSV its every line is one field of one channel.
    Write("run.txt", TextTableText({"title: Run", "operator: Ada"}, {"time", "speed", "temp"}));
    IndexData();
    auto server = StartIndexing();
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 1})) << "CSV comes first in the catalogue";

    Configure([](cv::rovo::IConfigurationEditor *editor) {
        auto order = Container({u"TextTable", u"CSV"});
        OkVoid([&](std::int32_t *status) { editor->SetExtensionParselets(WString(u"txt"), order.get(), status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 3}));
    EXPECT_EQ(StatusValue("SELECT count(*) FROM level_properties WHERE level = 0"), 2) << "title and operator";
    EXPECT_EQ(StatusValue("SELECT count(*) FROM files WHERE parselet = 'TextTable'"), 1);
}

TEST_F(IndexingProcessTest, AFileAddedWhileTheChangeTriggerIsOnIsIndexedAfterTheIdleTimeAndNotBefore)
{
    Write("a.csv", CsvText({}, {"x"}));
    IndexData();
    auto server = StartIndexing();
    const std::int64_t passes = Progress().passes;
    constexpr auto kIdle = std::chrono::seconds(2);
    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetIdleTime(std::uint32_t(kIdle.count()), status); });
    });
    ASSERT_EQ(StatusOf([&](std::int32_t *status) { Manager()->WaitForUpdate(status); }), 0);

    const auto written = std::chrono::steady_clock::now();
    Write("new/b.csv", CsvText({}, {"x", "y"}));
    // Seen, and not yet indexed: the count is read before a pass that has
    // not run yet.
    bool seenBeforeIndexing = false;
    ASSERT_TRUE(WaitFor([&] {
        const ElementCounts counts = Counts();
        const IndexerProgress progress = Progress();
        if (progress.pending && progress.passes == passes) {
            seenBeforeIndexing = true;
            EXPECT_EQ(counts.files, 1u);
        }
        return progress.passes > passes;
    }));
    EXPECT_TRUE(seenBeforeIndexing) << "the change waited for the idle time";
    ASSERT_TRUE(WaitFor([&] { return Counts().files == 2; }));
    EXPECT_GE(std::chrono::steady_clock::now() - written, kIdle);
}

TEST_F(IndexingProcessTest, ANamedPipeTimesOutForItsParseletWhileTheProgressShowsIndexingRuns)
{
    Write("a.csv", CsvText({}, {"x"}));
    Write("b.asc", TextTableText({}, {"x"}));
    ASSERT_EQ(::mkfifo(Data("never-ends.csv").c_str(), 0600), 0);
    IndexData();
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetFileTimeout(5000, status); });
    });
    auto server = Start({"--portname", kPort}, kPort);
    ASSERT_TRUE(WaitFor([&] {
        const IndexerProgress progress = Progress();
        return progress.running && progress.total > 0 && progress.done < progress.total;
    })) << "the counters differ while the pipe is read";
    ASSERT_TRUE(WaitFor([&] { return Progress().passes == 1; }));
    const IndexerProgress done = Progress();
    EXPECT_EQ(done.done, done.total);
    EXPECT_EQ(done.total, 3);

    EXPECT_EQ(Counts(), (ElementCounts{2, 2, 2}));
    testsupport::AccessRef access{cv::vek::rovo::dunemere::CreateDirectStoreAccess(u"P", 1)};
    EXPECT_EQ(access->GetFileviewsTimeouted(), 1u);
    std::u16string names[2];
    std::uint32_t counts[2] = {};
    std::uint32_t total = 0;
    access->GetFileviewsTimeoutedPerPlugIn(2, names, counts, &total);
    EXPECT_EQ(total, 1u);
    EXPECT_EQ(names[0], u"CSV");
    EXPECT_EQ(counts[0], 1u);

    OkVoid([&](std::int32_t *status) { Manager()->ResetTimeoutFiles(status); });
    EXPECT_EQ(access->GetFileviewsTimeouted(), 0u);
    EXPECT_EQ(StatusValue("SELECT count(*) FROM files WHERE path LIKE '%never-ends.csv'"), 0)
        << "the next indexing tries it again";
    EXPECT_EQ(Counts(), (ElementCounts{2, 2, 2}));
}

TEST_F(IndexingProcessTest, AGarbageFileCountsAsFailedUntilItsResetAndIsTriedAgain)
{
    Write("a.csv", CsvText({}, {"x"}));
    Write("garbage.csv", "a,b\n1,2,3\n");
    IndexData();
    auto server = StartIndexing();
    EXPECT_EQ(Failures(), 1);
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 1}));

    // Unchanged, it is not read again.
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Failures(), 1);

    OkVoid([&](std::int32_t *status) { Manager()->ResetFailedFiles(status); });
    EXPECT_EQ(Failures(), 0);
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Failures(), 1) << "read again, and still garbage";

    Write("garbage.csv", "a,b\n1,2\n");
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Failures(), 0) << "mended";
    EXPECT_EQ(Counts(), (ElementCounts{2, 2, 3}));
}

TEST_F(IndexingProcessTest, MalformedFilesOfEveryKindNeverStopTheServer)
{
    std::string binary;
    for (int i = 0; i < 4096; ++i)
        binary.push_back(char((i * 7919) % 256));
    const std::string longLine = "a\n" + std::string(3 << 20, '7') + "\n";
    for (const char *extension : {"csv", "asc"}) {
        const std::string e = extension;
        Write("empty." + e, "");
        Write("binary." + e, binary);
        Write("long." + e, e == "csv" ? longLine : "\n" + longLine);
        Write("utf8." + e, e == "csv" ? "# t = \xC3\x28\na\n" : "t: \xC3\x28\n\na\n");
        Write("ragged." + e, e == "csv" ? "a,b\n1\n" : "\na b\n1\n");
    }
    Write("header-only.csv", "a,b\n");
    Write("header-only.asc", "title: x\n\na b\n");
    IndexData();
    auto server = StartIndexing();
    EXPECT_EQ(Counts(), (ElementCounts{2, 2, 4})) << "only the two files with a header alone";
    EXPECT_EQ(Failures(), 10);
    EXPECT_EQ(StatusValue("SELECT count(*) FROM files WHERE outcome = 2 AND detail = ''"), 0) << "each says why";
    EXPECT_EQ(Progress().passes, 1) << "the server still serves";
    EXPECT_EQ(server->Stop(SIGTERM), 0);
}

TEST_F(IndexingProcessTest, AResetDropsTheIndexAndIndexesAgain)
{
    Write("a.csv", CsvText({}, {"x", "y"}));
    Write("garbage.csv", "a\n1,2\n");
    IndexData();
    auto server = StartIndexing();
    ASSERT_EQ(Counts(), (ElementCounts{1, 1, 2}));
    Write("b.csv", CsvText({}, {"x"})); // the reset's indexing finds it

    OkVoid([&](std::int32_t *status) { Sorvik()->ResetSorvik(cv::rovo::kResetIndex, 0, status); });
    WaitUntilIndexed();
    EXPECT_EQ(Counts(), (ElementCounts{2, 2, 3}));
    EXPECT_EQ(Failures(), 1);
}

TEST_F(IndexingProcessTest, AMovedIndexLocationKeepsTheIndex)
{
    Write("a.csv", CsvText({}, {"x", "y"}));
    IndexData();
    auto server = StartIndexing();
    const std::filesystem::path first = StatusFile();
    const std::filesystem::path moved = m_dir.path() / "store" / "moved-index";
    const std::int64_t read = StatusValue("SELECT count(*) FROM files");

    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(U16(moved.string())), status); });
    });
    WaitUntilIndexed();
    EXPECT_FALSE(std::filesystem::exists(first));
    EXPECT_TRUE(std::filesystem::exists(moved / "status.sqlite"));
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 2}));
    EXPECT_EQ(StatusValue("SELECT count(*) FROM files"), read);

    // Changed while no server runs: the next one takes its index along.
    EXPECT_EQ(server->Stop(SIGTERM), 0);
    const std::filesystem::path again = m_dir.path() / "store" / "again";
    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(U16(again.string())), status); });
    });
    server = StartIndexing();
    EXPECT_TRUE(std::filesystem::exists(again / "status.sqlite"));
    EXPECT_FALSE(std::filesystem::exists(moved / "status.sqlite"));
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 2}));
}

TEST_F(IndexingProcessTest, AnIndexFolderThatCannotBeMadeLeavesTheIndexWhereItIsAndTheWaitSaysWhy)
{
    Write("a.csv", CsvText({}, {"x", "y"}));
    IndexData();
    auto server = StartIndexing();
    const std::filesystem::path first = StatusFile();
    const std::filesystem::path blocked = Write("blocked.md", "a file, not a folder") / "index";

    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(U16(blocked.string())), status); });
        OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    });
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { Manager()->WaitForUpdate(status); }), status::Internal);
    Write("b.csv", CsvText({}, {"x"}));
    ASSERT_TRUE(WaitFor([&] { return Counts().files == 2; })) << "it goes on indexing";
    EXPECT_TRUE(std::filesystem::exists(first));
}

TEST_F(IndexingProcessTest, AServerWithoutItsParseletCatalogueLeavesTheIndexAsItIs)
{
    Write("a.csv", CsvText({}, {"x", "y"}));
    IndexData();
    auto server = StartIndexing();
    EXPECT_EQ(server->Stop(SIGTERM), 0);

    std::ofstream(m_dir.file("broken.xml")) << "<parselets format=\"1\">";
    {
        testsupport::ScopedEnv broken("CORVANE_VEKEX_CATALOGUE", m_dir.file("broken.xml").string());
        server = Start({"--portname", kPort}, kPort, m_dir.file("broken.out"));
    }
    Write("b.csv", CsvText({}, {"x"}));
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    });
    WaitUntilIndexed();
    EXPECT_EQ(Progress().passes, 0);
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 2})) << "nothing indexed, nothing lost";
    EXPECT_EQ(server->Stop(SIGTERM), 0);
}

TEST_F(IndexingProcessTest, AServerIndexesAtItsStartOnlyWhatIsMissingOrOutdated)
{
    Write("a.csv", CsvText({}, {"x"}));
    Write("sub/b.csv", CsvText({}, {"x"}));
    IndexData();
    Configure([](cv::rovo::IConfigurationEditor *editor) {
        OkVoid([&](std::int32_t *status) { editor->SetChangeTrigger(0, status); });
    });
    auto server = StartIndexing();
    EXPECT_EQ(server->Stop(SIGTERM), 0);

    server = Start({"--portname", kPort}, kPort);
    IndexerProgress progress = Progress();
    EXPECT_FALSE(progress.pending || progress.running) << "the index is current";
    EXPECT_EQ(progress.passes, 0);
    EXPECT_EQ(server->Stop(SIGTERM), 0);

    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        const WString sub(U16(Data("sub").string()));
        WString kept;
        OkVoid([&](std::int32_t *status) { editor->AddFolder(&kept, sub, sub, WString(u"sub"), 0, 1, WString(), status); });
    });
    server = StartIndexing();
    EXPECT_EQ(Counts(), (ElementCounts{1, 1, 1}));
}

} // namespace
