// The index manager of librovoApi against real Sorvik processes: it exists
// while the instance runs, WaitForUpdate follows the server taking up every
// commit, and the server's side of the manager channel keeps its state.

#include "serverfixture.h"
#include "tests/reference/referencelibs.h"

#include "reference/managerchannel/managerconnection.h"
#include "reference/managerchannel/managerprotocol.h"
#include "reference/server/serveroptions.h"

#include <gtest/gtest.h>

#include <sqlite3.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <future>
#include <thread>

namespace {

using namespace reftest;
using sorvik::manager::ManagerConnection;
namespace status = cv::rovo::status;

[[maybe_unused]] const bool g_registry = (InstallServerRegistry(), true);

template <typename Condition>
bool WaitFor(Condition condition, std::chrono::milliseconds within = std::chrono::seconds(20))
{
    const auto deadline = std::chrono::steady_clock::now() + within;
    while (!condition()) {
        if (std::chrono::steady_clock::now() >= deadline)
            return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return true;
}

// A running instance's state as its manager channel reports it.
struct ServerState
{
    std::int64_t applied = -1;
    std::int64_t browseMs = -1;
    std::int64_t queryMs = -1;
    std::int64_t waiting = -1;
};

ServerState StateOf(const std::u16string &portName)
{
    int error = 0;
    auto connection = ManagerConnection::Open(portName, 5000, error);
    if (!connection) {
        ADD_FAILURE() << "no manager channel: " << std::strerror(error);
        return {};
    }
    QJsonObject answer;
    EXPECT_EQ(connection->Call(QJsonObject{{sorvik::manager::kOp, sorvik::manager::op::State}}, answer, 5000),
              ManagerConnection::Result::Answered);
    namespace field = sorvik::manager::field;
    return {answer.value(field::Applied).toInteger(-1), answer.value(field::BrowseTimeoutMs).toInteger(-1),
            answer.value(field::QueryTimeoutMs).toInteger(-1), answer.value(field::Waiting).toInteger(-1)};
}

class IndexManagerTest : public ServerTest
{
protected:
    IndexManagerTest()
    {
        VekexLibrary().init();
        RovoLibrary().init();
        auto dataStore = DataStoreEnvironment();
        m_environment = RefPtr<cv::rovo::IRovoEnvironment>::Adopt(
            Ok([&](std::int32_t *status) { return RovoLibrary().createEnvironment(dataStore.get(), status); }));
    }
    ~IndexManagerTest() override
    {
        m_environment.Reset();
        RovoLibrary().cleanup();
        VekexLibrary().cleanup();
    }

    RefPtr<cv::rovo::ISorvik> Open(const char16_t *connection)
    {
        return RefPtr<cv::rovo::ISorvik>::Adopt(
            Ok([&](std::int32_t *status) { return m_environment->OpenSorvik(WString(connection), status); }));
    }
    static RefPtr<cv::rovo::IIndexManager> Manager(cv::rovo::ISorvik *sorvik)
    {
        return RefPtr<cv::rovo::IIndexManager>::Adopt(
            Ok([&](std::int32_t *status) { return sorvik->GetIndexManager(status); }));
    }
    static void CommitIdleTime(cv::rovo::ISorvik *sorvik, std::uint32_t seconds)
    {
        auto editor = RefPtr<cv::rovo::IConfigurationEditor>::Adopt(
            Ok([&](std::int32_t *status) { return sorvik->GetConfigurationEditor(status); }));
        OkVoid([&](std::int32_t *status) { editor->SetIdleTime(seconds, status); });
        OkVoid([&](std::int32_t *status) { editor->CommitConfiguration(status); });
    }
    static std::int32_t WaitForUpdate(cv::rovo::IIndexManager *manager)
    {
        return StatusOf([&](std::int32_t *status) { manager->WaitForUpdate(status); });
    }
    // The configuration generation committed to a store of this test.
    std::int64_t Committed(const std::string &storeFile) const
    {
        return Query(m_dir.path() / "store" / storeFile,
                     "SELECT CAST(value AS INTEGER) FROM meta WHERE name = 'config_generation'");
    }
    std::int64_t StatusValue(const std::string &sql) const { return Query(StatusFile(), sql); }

    static std::int64_t Query(const std::filesystem::path &file, const std::string &sql)
    {
        sqlite3 *db = nullptr;
        EXPECT_EQ(sqlite3_open_v2(file.c_str(), &db, SQLITE_OPEN_READONLY, nullptr), SQLITE_OK) << file;
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

    RefPtr<cv::rovo::IRovoEnvironment> m_environment;
};

TEST_F(IndexManagerTest, ThereIsAnIndexManagerExactlyWhileTheSorviksInstanceRuns)
{
    auto local = Open(u"");
    auto instance = Open(u"<PortName>P</PortName>");
    EXPECT_FALSE(Manager(local.get())) << "no server runs";
    EXPECT_FALSE(Manager(instance.get()));
    EXPECT_FALSE(Manager(Open(u"<PortName>no/socket</PortName>").get())) << "no server can serve that name";

    auto server = Start({"--portname", "P"}, "P");
    auto manager = Manager(instance.get());
    ASSERT_TRUE(manager);
    EXPECT_FALSE(Manager(local.get())) << "P does not serve the local Sorvik";
    EXPECT_FALSE(Manager(Open(u"<Name>Other</Name><PortName>P</PortName>").get())) << "P serves another store";
    EXPECT_TRUE(Manager(Open(u"<Name>P</Name>").get())) << "the instance named like the Sorvik";
    EXPECT_TRUE(Ok([&](std::int32_t *status) { return manager->GetServerFlag(status); }));
    EXPECT_EQ(Ok([&](std::int32_t *status) { return manager->GetVersion(status); }), 18.0);
    auto context = RefPtr<cv::rovo::IServerContext>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetServerContext(status); }));
    WString portName;
    OkVoid([&](std::int32_t *status) { context->GetPortName(&portName, status); });
    EXPECT_EQ(Utf8(portName), "P");

    EXPECT_EQ(server->Stop(SIGTERM), 0);
    EXPECT_FALSE(Manager(instance.get()));
    EXPECT_EQ(WaitForUpdate(manager.get()), status::ServerNotRunning);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { manager->GetVersion(status); }), status::ServerNotRunning);

    auto localServer = Start({}, "");
    auto localManager = Manager(local.get());
    ASSERT_TRUE(localManager);
    EXPECT_FALSE(Ok([&](std::int32_t *status) { return localManager->GetServerFlag(status); }));
    context = RefPtr<cv::rovo::IServerContext>::Adopt(
        Ok([&](std::int32_t *status) { return localManager->GetServerContext(status); }));
    OkVoid([&](std::int32_t *status) { context->GetPortName(&portName, status); });
    EXPECT_EQ(Utf8(portName), "");
}

TEST_F(IndexManagerTest, VersionIsMajorMinorAndPatchAsOneDecimal)
{
    auto resettable = Start({"--portname", "New", "--version", "2.1.0"}, "New");
    auto older = Start({"--portname", "Old", "--version", "2.0.15"}, "Old");
    auto newer = Manager(Open(u"<PortName>New</PortName>").get());
    auto old = Manager(Open(u"<PortName>Old</PortName>").get());
    ASSERT_TRUE(newer && old);
    EXPECT_EQ(Ok([&](std::int32_t *status) { return newer->GetVersion(status); }), 2.01);
    EXPECT_LT(Ok([&](std::int32_t *status) { return old->GetVersion(status); }), 2.01);
}

TEST_F(IndexManagerTest, WaitForUpdateReturnsOnceTheServerHasTakenUpTheLastCommit)
{
    auto server = Start({"--portname", "P"}, "P");
    auto sorvik = Open(u"<PortName>P</PortName>");
    auto manager = Manager(sorvik.get());
    ASSERT_TRUE(manager);
    EXPECT_EQ(WaitForUpdate(manager.get()), 0) << "nothing to wait for";

    for (std::uint32_t seconds : {30u, 40u, 50u}) {
        CommitIdleTime(sorvik.get(), seconds);
        ASSERT_EQ(WaitForUpdate(manager.get()), 0);
        EXPECT_GE(StateOf(u"P").applied, Committed("sorvik-p.sorvikdb"));
    }
    EXPECT_EQ(StatusValue("SELECT value FROM counters WHERE name = 'applied_generation'"),
              Committed("sorvik-p.sorvikdb"))
        << "the server records what it has applied beside the index";
}

TEST_F(IndexManagerTest, ASlowServerTimesTheWaitOutUntilItHasTakenTheCommitUp)
{
    auto server = Start({"--portname", "Slow", "--apply-delay-ms", "1500"}, "Slow");
    auto sorvik = Open(u"<PortName>Slow</PortName>");
    auto manager = Manager(sorvik.get());
    ASSERT_TRUE(manager);
    testsupport::ScopedEnv timeout("CORVANE_SORVIK_UPDATE_TIMEOUT_MS", "100");
    CommitIdleTime(sorvik.get(), 30);

    EXPECT_EQ(WaitForUpdate(manager.get()), status::UpdateTimedOut);
    std::int32_t result = status::UpdateTimedOut;
    ASSERT_TRUE(WaitFor([&] { return (result = WaitForUpdate(manager.get())) != status::UpdateTimedOut; }));
    EXPECT_EQ(result, 0);
    EXPECT_GE(StateOf(u"Slow").applied, Committed("sorvik-slow.sorvikdb"));
}

TEST_F(IndexManagerTest, ACommitOfAnotherProcessIsWaitedFor)
{
    auto server = Start({"--portname", "P", "--apply-delay-ms", "2000"}, "P");
    auto manager = Manager(Open(u"<PortName>P</PortName>").get());
    ASSERT_TRUE(manager);
    testsupport::SorvikProcess other(ROVO_COMMIT_TOOL, {"<PortName>P</PortName>", "77"});
    ASSERT_EQ(other.Wait(std::chrono::seconds(60)), 0);
    const std::int64_t committed = Committed("sorvik-p.sorvikdb");
    ASSERT_GE(committed, 1);

    testsupport::ScopedEnv timeout("CORVANE_SORVIK_UPDATE_TIMEOUT_MS", "60000");
    EXPECT_EQ(WaitForUpdate(manager.get()), 0);
    EXPECT_GE(StateOf(u"P").applied, committed);
}

TEST_F(IndexManagerTest, AWaitEndsPromptlyWhenTheServerIsKilled)
{
    auto server = Start({"--portname", "P", "--apply-delay-ms", "600000"}, "P");
    auto sorvik = Open(u"<PortName>P</PortName>");
    auto manager = Manager(sorvik.get());
    ASSERT_TRUE(manager);
    testsupport::ScopedEnv timeout("CORVANE_SORVIK_UPDATE_TIMEOUT_MS", "600000");
    CommitIdleTime(sorvik.get(), 30);

    auto waiting = std::async(std::launch::async, [&] { return WaitForUpdate(manager.get()); });
    ASSERT_TRUE(WaitFor([] { return StateOf(u"P").waiting == 1; }));
    server->Stop(SIGKILL);
    ASSERT_EQ(waiting.wait_for(std::chrono::seconds(10)), std::future_status::ready)
        << "still waiting long after the server died";
    EXPECT_EQ(waiting.get(), status::ServerNotRunning);
    EXPECT_FALSE(Manager(sorvik.get()));
}

TEST_F(IndexManagerTest, ReleasingEveryOtherReferenceLeavesAWaitInProgressAlone)
{
    auto server = Start({"--portname", "P", "--apply-delay-ms", "1000"}, "P");
    auto sorvik = Open(u"<PortName>P</PortName>");
    auto manager = Manager(sorvik.get());
    ASSERT_TRUE(manager);
    testsupport::ScopedEnv timeout("CORVANE_SORVIK_UPDATE_TIMEOUT_MS", "60000");
    CommitIdleTime(sorvik.get(), 30);

    RefPtr<cv::rovo::IIndexManager> workersOwn = manager;
    auto waiting = std::async(std::launch::async, [own = std::move(workersOwn)] { return WaitForUpdate(own.get()); });
    ASSERT_TRUE(WaitFor([] { return StateOf(u"P").waiting == 1; }));
    manager.Reset();
    sorvik.Reset();
    m_environment.Reset();
    EXPECT_EQ(waiting.get(), 0);
}

TEST_F(IndexManagerTest, ServiceTimeoutsTakeEffectAtOnceAndCommitsChangeThem)
{
    auto server = Start({"--portname", "P"}, "P");
    auto sorvik = Open(u"<PortName>P</PortName>");
    auto manager = Manager(sorvik.get());
    ASSERT_TRUE(manager);
    EXPECT_EQ(StateOf(u"P").browseMs, 5000) << "not configured: the defaults";
    EXPECT_EQ(StateOf(u"P").queryMs, 20000);

    OkVoid([&](std::int32_t *status) { manager->SetServiceTimeout(cv::rovo::kBrowseTimeout, 7000, status); });
    OkVoid([&](std::int32_t *status) { manager->SetServiceTimeout(cv::rovo::kQueryTimeout, 45000, status); });
    EXPECT_EQ(StateOf(u"P").browseMs, 7000);
    EXPECT_EQ(StateOf(u"P").queryMs, 45000);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { manager->SetServiceTimeout(3, 7000, status); }),
              status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { manager->SetServiceTimeout(1, 0, status); }),
              status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { manager->SetServiceTimeout(1, 10000000, status); }),
              status::InvalidArgument);

    CommitIdleTime(sorvik.get(), 30);
    ASSERT_EQ(WaitForUpdate(manager.get()), 0);
    EXPECT_EQ(StateOf(u"P").browseMs, 7000) << "a commit that leaves the time-outs keeps what was set";

    auto editor = RefPtr<cv::rovo::IConfigurationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return sorvik->GetConfigurationEditor(status); }));
    OkVoid([&](std::int32_t *status) { editor->SetBrowseTimeout(9, status); });
    OkVoid([&](std::int32_t *status) { editor->CommitConfiguration(status); });
    ASSERT_EQ(WaitForUpdate(manager.get()), 0);
    EXPECT_EQ(StateOf(u"P").browseMs, 9000);
    EXPECT_EQ(StateOf(u"P").queryMs, 45000);
}

TEST_F(IndexManagerTest, FileResetsClearWhatTheirStatisticsCount)
{
    auto server = Start({"--portname", "P"}, "P");
    auto manager = Manager(Open(u"<PortName>P</PortName>").get());
    ASSERT_TRUE(manager);
    Sql("INSERT INTO parselet_timeouts VALUES ('CSV', 3); INSERT INTO counters VALUES ('failures', 4)");

    OkVoid([&](std::int32_t *status) { manager->ResetTimeoutFiles(status); });
    EXPECT_EQ(StatusValue("SELECT count(*) FROM parselet_timeouts"), 0);
    EXPECT_EQ(StatusValue("SELECT value FROM counters WHERE name = 'failures'"), 4);
    OkVoid([&](std::int32_t *status) { manager->ResetFailedFiles(status); });
    EXPECT_EQ(StatusValue("SELECT value FROM counters WHERE name = 'failures'"), 0);
}

TEST_F(IndexManagerTest, AResetIsTakenUpOnceWhetherTheServerRunsOrNot)
{
    const char *const fillIndex = "INSERT OR REPLACE INTO element_counts VALUES (8, 120), (16, 7);"
                                  "INSERT OR REPLACE INTO parselet_timeouts VALUES ('CSV', 3)";
    auto sorvik = Open(u"<PortName>P</PortName>");
    {
        auto server = Start({"--portname", "P"}, "P");
        auto manager = Manager(sorvik.get());
        ASSERT_TRUE(manager);
        Sql(fillIndex);
        OkVoid([&](std::int32_t *status) { sorvik->ResetSorvik(cv::rovo::kResetIndex, 0, status); });
        ASSERT_EQ(WaitForUpdate(manager.get()), 0);
        EXPECT_EQ(StatusValue("SELECT count(*) FROM element_counts"), 0);
        EXPECT_EQ(StatusValue("SELECT count(*) FROM parselet_timeouts"), 0);
        Sql(fillIndex);
        EXPECT_EQ(server->Stop(SIGTERM), 0);
    }
    {
        auto server = Start({"--portname", "P"}, "P");
        EXPECT_EQ(StatusValue("SELECT count(*) FROM element_counts"), 2) << "a reset is done once";
        EXPECT_EQ(server->Stop(SIGTERM), 0);
    }
    OkVoid([&](std::int32_t *status) { sorvik->ResetSorvik(cv::rovo::kResetIndexAndConfiguration, 0, status); });
    auto server = Start({"--portname", "P"}, "P");
    EXPECT_EQ(StatusValue("SELECT count(*) FROM element_counts"), 0) << "a reset made while no server ran";
}

TEST_F(IndexManagerTest, ThePropertySideIsOfferedForItsThreeLevelsOnly)
{
    auto server = Start({"--portname", "P"}, "P");
    auto manager = Manager(Open(u"<PortName>P</PortName>").get());
    ASSERT_TRUE(manager);
    for (const char16_t *level : {u"sorvik_root", u"qdm_channelgroup", u"qdm_channel"}) {
        auto list = RefPtr<cv::rovo::ILevelPropertyList>::Adopt(
            Ok([&](std::int32_t *status) { return manager->GetLevelProperties(WString(level), status); }));
        ASSERT_TRUE(list);
        OkVoid([&](std::int32_t *status) { list->Fetch(status); });
        EXPECT_EQ(Ok([&](std::int32_t *status) { return list->GetCount(status); }), 0u) << "nothing is indexed";
    }
    std::int32_t result = 0;
    EXPECT_EQ(manager->GetLevelProperties(WString(u"file"), &result), nullptr);
    EXPECT_EQ(result, status::NotFound);
    EXPECT_TRUE(RefPtr<cv::rovo::IOptimizationEditor>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetOptimizationEditor(status); })));
    auto index = RefPtr<cv::rovo::IIndexStatus>::Adopt(Ok([&](std::int32_t *status) { return manager->GetIndexStatus(status); }));
    ASSERT_TRUE(index);
    std::uint32_t state = 0;
    result = 0;
    index->GetOptimizationState(WString(u"channel"), WString(u"unit"), &state, &result);
    EXPECT_EQ(result, status::NotFound);
    auto context = RefPtr<cv::rovo::IServerContext>::Adopt(
        Ok([&](std::int32_t *status) { return manager->GetServerContext(status); }));
    EXPECT_TRUE(RefPtr<cv::rovo::IPropertyModel>::Adopt(
        Ok([&](std::int32_t *status) { return context->GetPropertyModel(status); })));
}

// Writes raw bytes to the instance's manager socket.
int RawConnection(const std::u16string &portName)
{
    const std::filesystem::path path = sorvik::manager::SocketPath(portName);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strcpy(address.sun_path, path.c_str());
    const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
    EXPECT_EQ(::connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address), 0);
    return fd;
}

std::int64_t StatusOfAnswer(ManagerConnection &connection, const QJsonObject &request)
{
    QJsonObject answer;
    if (connection.Call(request, answer, 5000) != ManagerConnection::Result::Answered)
        return 1;
    return answer.value(sorvik::manager::kStatus).toInteger(1);
}

TEST_F(IndexManagerTest, TheChannelAnswersWhatIsNoRequestAndKeepsServing)
{
    auto server = Start({"--portname", "P"}, "P");
    int error = 0;
    auto connection = ManagerConnection::Open(u"P", 5000, error);
    ASSERT_TRUE(connection);
    namespace op = sorvik::manager::op;
    using sorvik::manager::kOp;
    EXPECT_EQ(StatusOfAnswer(*connection, QJsonObject{{kOp, QStringLiteral("optimize-everything")}}),
              status::Unsupported);
    EXPECT_EQ(StatusOfAnswer(*connection, QJsonObject{{kOp, op::WaitApplied}}), status::InvalidArgument);
    EXPECT_EQ(StatusOfAnswer(*connection, QJsonObject{{kOp, op::WaitApplied}, {sorvik::manager::field::Generation, -1}}),
              status::InvalidArgument);
    EXPECT_EQ(StatusOfAnswer(*connection, QJsonObject{{kOp, op::Hello}}), 0) << "the connection still serves";

    // Frames that hold no request, then a frame that stops half-way.
    for (const std::string &payload : std::vector<std::string>{"not json", "[1,2]", std::string(2 << 20, '{')}) {
        const int fd = RawConnection(u"P");
        const std::uint32_t size = std::uint32_t(payload.size());
        std::string frame(reinterpret_cast<const char *>(&size), 4);
        frame += payload;
        ASSERT_EQ(::send(fd, frame.data(), frame.size(), MSG_NOSIGNAL), ssize_t(frame.size()));
        char header[4];
        EXPECT_EQ(::recv(fd, header, 4, MSG_WAITALL), 4) << "an answer for " << payload.substr(0, 10);
        ::close(fd);
    }
    const int half = RawConnection(u"P");
    ASSERT_EQ(::send(half, "\x20\0\0\0{\"op\"", 9, MSG_NOSIGNAL), 9);
    ::close(half);
    EXPECT_EQ(StatusOfAnswer(*connection, QJsonObject{{kOp, op::Hello}}), 0);
}

TEST(ServerOptions, ApplyDelayIsMillisecondsUpToADay)
{
    auto parse = [](std::vector<const char *> arguments, std::string &error) {
        arguments.insert(arguments.begin(), "Sorvik");
        return sorvik::server::ParseServerOptions(int(arguments.size()), const_cast<char **>(arguments.data()), error);
    };
    std::string error;
    EXPECT_EQ(parse({}, error)->applyDelayMs, 0u);
    EXPECT_EQ(parse({"--apply-delay-ms", "2500"}, error)->applyDelayMs, 2500u);
    EXPECT_EQ(parse({"--apply-delay-ms", "86400000"}, error)->applyDelayMs, 86400000u);
    for (const char *bad : {"-1", "1.5", "ten", "86400001", ""}) {
        EXPECT_FALSE(parse({"--apply-delay-ms", bad}, error)) << bad;
        EXPECT_NE(error.find("--apply-delay-ms"), std::string::npos);
    }
}

} // namespace
