// The parts of the indexer that need no server: the schedule, the plan of
// what is indexed by which Parselet, reading with a deadline, and the
// records that keep the statistics in step with the files.

#include "reference/server/filereading.h"
#include "reference/server/indexplan.h"
#include "reference/server/indexrecords.h"
#include "reference/server/schedule.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/eventfd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fstream>
#include <thread>

namespace {

using namespace sorvik::server;
namespace rovo = sorvik::rovo;
using Clock = std::chrono::steady_clock;

QDateTime Utc(const char *text)
{
    return QDateTime::fromString(QString::fromLatin1(text), Qt::ISODate).toUTC();
}

QString Next(std::int32_t kind, cv::rovo::CalendarTime when, const char *after)
{
    const auto next = NextScheduledRun(kind, when, Utc(after));
    return next ? next->toString(Qt::ISODate) : QStringLiteral("never");
}

TEST(Schedule, RunsHourlyDailyAndWeeklyAtTheStartTimeAndWeekdayInUtc)
{
    const cv::rovo::CalendarTime twoThirty{1977, 9, 14, 2, 30, 0}; // a Wednesday
    EXPECT_EQ(Next(cv::rovo::kScheduleHourly, twoThirty, "2024-03-04T10:15:00Z"), "2024-03-04T10:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleHourly, twoThirty, "2024-03-04T10:30:00Z"), "2024-03-04T11:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleHourly, twoThirty, "2024-03-04T23:45:00Z"), "2024-03-05T00:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleDaily, twoThirty, "2024-03-04T01:00:00Z"), "2024-03-04T02:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleDaily, twoThirty, "2024-03-04T02:30:01Z"), "2024-03-05T02:30:00Z");
    // 4 March 2024 is a Monday: the next Wednesday is the 6th.
    EXPECT_EQ(Next(cv::rovo::kScheduleWeekly, twoThirty, "2024-03-04T12:00:00Z"), "2024-03-06T02:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleWeekly, twoThirty, "2024-03-06T03:00:00Z"), "2024-03-13T02:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleWeeklyLegacy, twoThirty, "2024-03-06T02:00:00Z"), "2024-03-06T02:30:00Z");
    EXPECT_EQ(Next(cv::rovo::kScheduleNever, twoThirty, "2024-03-04T12:00:00Z"), "never");
    EXPECT_EQ(Next(4, twoThirty, "2024-03-04T12:00:00Z"), "never");
}

rovo::ParseletInfo Parselet(const char *name, std::vector<QString> extensions, bool importSupported = true)
{
    rovo::ParseletInfo parselet;
    parselet.name = QString::fromLatin1(name);
    parselet.extensions = std::move(extensions);
    parselet.importSupported = importSupported;
    return parselet;
}

TEST(IndexPlan, EachExtensionGoesToItsFirstActiveParseletInPriorityOrder)
{
    rovo::CatalogueInfo catalogue;
    catalogue.parselets = {Parselet("CSV", {"csv", "txt"}), Parselet("TextTable", {"txt", "asc"}),
                           Parselet("MatrixStore", {"mat"}, false)};
    rovo::Configuration configuration;
    configuration.areas.push_back({{QStringLiteral("/data"), {}, {}, {}}, {{QStringLiteral("/data/Tmp"), {}, {}, {}}}});

    IndexPlan plan = MakePlan(configuration, catalogue);
    EXPECT_EQ(*plan.ParseletFor("run.TXT"), "CSV") << "catalogue order";
    EXPECT_EQ(*plan.ParseletFor("x.asc"), "TextTable");
    EXPECT_EQ(plan.ParseletFor("m.mat"), nullptr) << "not active without import support";
    EXPECT_EQ(plan.ParseletFor("noextension"), nullptr);
    EXPECT_EQ(plan.ParseletFor("trailing."), nullptr);
    ASSERT_EQ(plan.areas.size(), 1u);
    EXPECT_TRUE(IndexPlan::IsExcluded(plan.areas[0], "/data/tmp")) << "paths compare as the store compares them";
    EXPECT_FALSE(IndexPlan::IsExcluded(plan.areas[0], "/data/tmp2"));
    const std::string before = plan.Fingerprint();

    configuration.priorities.push_back({QStringLiteral("txt"), {QStringLiteral("TextTable"), QStringLiteral("CSV")}});
    plan = MakePlan(configuration, catalogue);
    EXPECT_EQ(*plan.ParseletFor("run.txt"), "TextTable");
    EXPECT_NE(plan.Fingerprint(), before);

    configuration.parselets.push_back({QStringLiteral("textTABLE"), false});
    plan = MakePlan(configuration, catalogue);
    EXPECT_EQ(*plan.ParseletFor("run.txt"), "CSV");
    EXPECT_EQ(plan.ParseletFor("x.asc"), nullptr);
    EXPECT_EQ(ExtensionKey("R\xC3\x9C" "N.\xC3\x9C"), "\xC3\xBC") << "non-ASCII extensions fold as well";
}

struct Fd
{
    int fd;
    ~Fd() { ::close(fd); }
};

std::string ReadAll(const std::string &path, std::chrono::milliseconds within, ReadOutcome &outcome,
                    const ReadInterruption &interruption = {})
{
    std::vector<char> buffer;
    std::string bytes;
    outcome = ReadWithDeadline(path, Clock::now() + within, interruption, buffer,
                               [&](std::string_view piece) { bytes.append(piece); })
                  .outcome;
    return bytes;
}

TEST(ReadWithDeadline, APipeThatNeverEndsTimesOutAndOneThatEndsIsRead)
{
    testsupport::TempDir dir;
    const std::string pipe = dir.file("pipe.csv").string();
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    ReadOutcome outcome;
    const auto started = Clock::now();
    ReadAll(pipe, std::chrono::milliseconds(200), outcome);
    EXPECT_EQ(outcome, ReadOutcome::TimedOut) << "no writer ever came";
    EXPECT_GE(Clock::now() - started, std::chrono::milliseconds(200));

    std::thread writer([&] {
        const Fd out{::open(pipe.c_str(), O_WRONLY)};
        ASSERT_EQ(::write(out.fd, "a,b\n", 4), 4);
    });
    EXPECT_EQ(ReadAll(pipe, std::chrono::seconds(20), outcome), "a,b\n");
    EXPECT_EQ(outcome, ReadOutcome::Complete);
    writer.join();

    // A writer that keeps it open and says nothing.
    const Fd reader{::open(pipe.c_str(), O_RDONLY | O_NONBLOCK)};
    const Fd silent{::open(pipe.c_str(), O_WRONLY)};
    ReadAll(pipe, std::chrono::milliseconds(100), outcome);
    EXPECT_EQ(outcome, ReadOutcome::TimedOut);
}

TEST(ReadWithDeadline, AWaitingReadEndsWhenAskedToAndFilesThatAreNoneFail)
{
    testsupport::TempDir dir;
    const std::string pipe = dir.file("pipe.csv").string();
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    const Fd wake{::eventfd(1, EFD_NONBLOCK)};
    int asked = 0;
    ReadInterruption interruption{wake.fd, [&] { return ++asked > 0; }};
    ReadOutcome outcome;
    ReadAll(pipe, std::chrono::seconds(60), outcome, interruption);
    EXPECT_EQ(outcome, ReadOutcome::Stopped);
    EXPECT_EQ(asked, 1);

    std::ofstream(dir.file("plain.csv")) << "x\n1\n";
    EXPECT_EQ(ReadAll(dir.file("plain.csv").string(), std::chrono::seconds(5), outcome), "x\n1\n");
    EXPECT_EQ(outcome, ReadOutcome::Complete);
    ReadAll(dir.path().string(), std::chrono::seconds(5), outcome);
    EXPECT_EQ(outcome, ReadOutcome::Unreadable) << "a folder";
    ReadAll(dir.file("missing.csv").string(), std::chrono::seconds(5), outcome);
    EXPECT_EQ(outcome, ReadOutcome::Unreadable);
}

FileOutcome Indexed(const std::string &path, std::size_t channels, const char *parselet = "CSV")
{
    FileOutcome outcome;
    outcome.path = path;
    outcome.signature = {10, 20, parselet};
    for (std::size_t i = 0; i < channels; ++i)
        outcome.content.channels.push_back({"c" + std::to_string(i), {{"unit", "s", sorvik::readers::DataType::String}}});
    outcome.content.fileProperties.push_back({"run", "1", sorvik::readers::DataType::Integer});
    return outcome;
}

FileOutcome NotIndexed(const std::string &path, FileOutcomeKind kind, const char *parselet = "CSV")
{
    FileOutcome outcome;
    outcome.path = path;
    outcome.signature = {1, 2, parselet};
    outcome.kind = kind;
    outcome.detail = "why";
    return outcome;
}

TEST(IndexRecords, TheStatisticsFollowEveryChangeOfTheFiles)
{
    testsupport::TempDir dir;
    IndexStatus status(QString::fromStdString(dir.path().string()));
    IndexRecords records(status);
    std::uint64_t epoch = 0;
    EXPECT_TRUE(records.Snapshot(epoch).empty());

    ASSERT_TRUE(records.Record(epoch,
                               {Indexed("/a.csv", 2), Indexed("/b.asc", 3, "TextTable"),
                                NotIndexed("/pipe.csv", FileOutcomeKind::TimedOut),
                                NotIndexed("/x.asc", FileOutcomeKind::TimedOut, "TextTable"),
                                NotIndexed("/bad.csv", FileOutcomeKind::Failed)},
                               {}));
    EXPECT_EQ(status.ElementCount(8), 2u);
    EXPECT_EQ(status.ElementCount(16), 2u);
    EXPECT_EQ(status.ElementCount(32), 5u);
    EXPECT_EQ(status.FileviewsTimeouted(), 2u);
    EXPECT_EQ(status.FileviewsTimeoutedPerParselet().text, u"CSV$1;TextTable$1;");

    // Read again with other outcomes, and gone.
    ASSERT_TRUE(records.Record(epoch, {Indexed("/pipe.csv", 1), NotIndexed("/a.csv", FileOutcomeKind::Failed)},
                               {"/b.asc", "/never-known.csv"}));
    EXPECT_EQ(status.ElementCount(8), 1u);
    EXPECT_EQ(status.ElementCount(32), 1u);
    EXPECT_EQ(status.FileviewsTimeoutedPerParselet().text, u"TextTable$1;");
    EXPECT_EQ(records.Snapshot(epoch).size(), 4u);
    ASSERT_TRUE(records.Complete(epoch, "plan", 1234));
    EXPECT_EQ(records.Last()->planFingerprint, "plan");
    EXPECT_EQ(records.Last()->endedMs, 1234);

    status.ResetTimeouted();
    EXPECT_EQ(status.FileviewsTimeouted(), 0u);
    EXPECT_EQ(records.Snapshot(epoch).count("/x.asc"), 0u) << "read again by the next indexing";

    status.ResetIndex();
    EXPECT_FALSE(records.Record(epoch, {Indexed("/late.csv", 1)}, {})) << "read before the reset";
    EXPECT_FALSE(records.Complete(epoch, "plan", 1));
    EXPECT_EQ(status.ElementCount(8), 0u);
    EXPECT_FALSE(records.Last());
    EXPECT_TRUE(records.Snapshot(epoch).empty());
}

} // namespace
