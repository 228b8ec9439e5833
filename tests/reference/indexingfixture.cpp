#include "indexingfixture.h"

#include "support/directstoreaccessref.h"

#include "dunemere/directstoreaccess.h"
#include "reference/managerchannel/managerconnection.h"
#include "reference/managerchannel/managerprotocol.h"

#include <sqlite3.h>

#include <fstream>
#include <ostream>
#include <thread>

namespace reftest {

namespace {

using cv::vek::rovo::dunemere::CreateDirectStoreAccess;
using testsupport::AccessRef;

} // namespace

std::ostream &operator<<(std::ostream &out, const ElementCounts &counts)
{
    return out << counts.files << " files, " << counts.groups << " groups, " << counts.channels << " channels";
}

IndexingTest::IndexingTest()
{
    VekexLibrary().init();
    RovoLibrary().init();
    auto dataStore = DataStoreEnvironment();
    m_environment = RefPtr<cv::rovo::IRovoEnvironment>::Adopt(
        Ok([&](std::int32_t *status) { return RovoLibrary().createEnvironment(dataStore.get(), status); }));
    std::filesystem::create_directories(Data());
}

IndexingTest::~IndexingTest()
{
    m_environment.Reset();
    RovoLibrary().cleanup();
    VekexLibrary().cleanup();
}

void IndexingTest::Pause()
{
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
}

RefPtr<cv::rovo::ISorvik> IndexingTest::Sorvik()
{
    return RefPtr<cv::rovo::ISorvik>::Adopt(Ok(
        [&](std::int32_t *status) { return m_environment->OpenSorvik(WString(u"<PortName>P</PortName>"), status); }));
}

void IndexingTest::Configure(const std::function<void(cv::rovo::IConfigurationEditor *)> &edit)
{
    auto sorvik = Sorvik();
    auto editor = RefPtr<cv::rovo::IConfigurationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return sorvik->GetConfigurationEditor(status); }));
    edit(editor.get());
    OkVoid([&](std::int32_t *status) { editor->CommitConfiguration(status); });
}

void IndexingTest::IndexData(const std::string &below)
{
    Configure([&](cv::rovo::IConfigurationEditor *editor) {
        const WString path(U16(Data(below).string()));
        WString kept;
        OkVoid([&](std::int32_t *status) {
            editor->AddFolder(&kept, path, path, WString(u"data"), 1, 0, WString(), status);
        });
        OkVoid([&](std::int32_t *status) { editor->SetIdleTime(0, status); });
    });
}

std::unique_ptr<testsupport::SorvikProcess> IndexingTest::StartIndexing(std::vector<std::string> extra)
{
    extra.insert(extra.begin(), {"--portname", kPort});
    auto server = Start(extra, kPort, m_dir.file("server.out"));
    EXPECT_TRUE(WaitFor([&] {
        const IndexerProgress progress = Progress();
        return progress.passes >= 1 && !progress.running && !progress.pending;
    })) << "the first indexing did not end";
    return server;
}

RefPtr<cv::rovo::IIndexManager> IndexingTest::Manager()
{
    auto sorvik = Sorvik();
    return RefPtr<cv::rovo::IIndexManager>::Adopt(
        Ok([&](std::int32_t *status) { return sorvik->GetIndexManager(status); }));
}

void IndexingTest::WaitUntilIndexed()
{
    auto manager = Manager();
    ASSERT_TRUE(manager) << "no server runs";
    ASSERT_EQ(StatusOf([&](std::int32_t *status) { manager->WaitForUpdate(status); }), 0);
    ASSERT_TRUE(WaitFor([&] {
        const IndexerProgress progress = Progress();
        return !progress.running && !progress.pending;
    })) << "indexing did not end";
}

IndexerProgress IndexingTest::Progress() const
{
    namespace manager = sorvik::manager;
    int error = 0;
    auto connection = manager::ManagerConnection::Open(u"P", 5000, error);
    if (!connection)
        return {};
    QJsonObject answer;
    if (connection->Call(QJsonObject{{manager::kOp, manager::op::IndexingProgress}}, answer, 5000) !=
        manager::ManagerConnection::Result::Answered)
        return {};
    namespace field = manager::field;
    return {answer.value(field::Done).toInteger(-1), answer.value(field::Total).toInteger(-1),
            answer.value(field::Passes).toInteger(-1), answer.value(field::Running).toBool(),
            answer.value(field::Pending).toBool()};
}

ElementCounts IndexingTest::Counts() const
{
    AccessRef access{CreateDirectStoreAccess(u"P", 1)};
    return {access->GetElementCount(8), access->GetElementCount(16), access->GetElementCount(32)};
}

std::uint32_t IndexingTest::Timeouts() const
{
    AccessRef access{CreateDirectStoreAccess(u"P", 1)};
    return access->GetFileviewsTimeouted();
}

std::int64_t IndexingTest::Failures() const
{
    return StatusValue("SELECT coalesce((SELECT value FROM counters WHERE name = 'failures'), 0)");
}

std::int64_t IndexingTest::StatusValue(const std::string &sql) const
{
    sqlite3 *db = nullptr;
    EXPECT_EQ(sqlite3_open_v2(StatusFile().c_str(), &db, SQLITE_OPEN_READONLY, nullptr), SQLITE_OK);
    sqlite3_busy_timeout(db, 5000);
    sqlite3_stmt *statement = nullptr;
    std::int64_t value = -1;
    if (sqlite3_prepare_v2(db, sql.c_str(), -1, &statement, nullptr) == SQLITE_OK &&
        sqlite3_step(statement) == SQLITE_ROW)
        value = sqlite3_column_int64(statement, 0);
    sqlite3_finalize(statement);
    sqlite3_close(db);
    return value;
}

std::filesystem::path IndexingTest::Data(const std::string &relative) const
{
    return relative.empty() ? m_dir.path() / "data" : m_dir.path() / "data" / relative;
}

std::filesystem::path IndexingTest::Write(const std::string &relative, const std::string &content) const
{
    const std::filesystem::path file = Data(relative);
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << content;
    return file;
}

std::string CsvText(const std::vector<std::string> &fileProperties, const std::vector<std::string> &channels,
                    const std::vector<std::string> &channelProperties, int rows,
                    const std::vector<std::string> &groupProperties)
{
    std::string text;
    for (const std::string &property : fileProperties)
        text += "# " + property + "\n";
    for (const std::string &property : groupProperties)
        text += "## " + property + "\n";
    for (std::size_t i = 0; i < channels.size(); ++i)
        text += (i ? "," : "") + channels[i];
    text += "\n";
    for (const std::string &line : channelProperties)
        text += "#" + line + "\n";
    for (int row = 0; row < rows; ++row) {
        for (std::size_t i = 0; i < channels.size(); ++i)
            text += (i ? "," : "") + std::to_string(row * 10 + int(i));
        text += "\n";
    }
    return text;
}

std::string TextTableText(const std::vector<std::string> &header, const std::vector<std::string> &channels, int rows)
{
    std::string text;
    for (const std::string &line : header)
        text += line + "\n";
    text += "\n";
    for (std::size_t i = 0; i < channels.size(); ++i)
        text += (i ? "\t" : "") + channels[i];
    text += "\n";
    for (int row = 0; row < rows; ++row) {
        for (std::size_t i = 0; i < channels.size(); ++i)
            text += (i ? " " : "") + std::to_string(row + int(i));
        text += "\n";
    }
    return text;
}

} // namespace reftest
