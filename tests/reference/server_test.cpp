#include "serverfixture.h"

#include "support/directstoreaccessref.h"

#include "dunemere/config.h"
#include "dunemere/directstoreaccess.h"
#include "dunemere/instancenames.h"
#include "dunemere/requestorbase.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/tointmsgda.h"
#include "krn/utf.h"
#include "log/ilogimp.h"
#include "sorvik/packedversion.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <condition_variable>
#include <fstream>
#include <mutex>
#include <thread>

namespace {

using namespace cv::vek::rovo::dunemere;
using cv::vek::rovo::RequestorBase;
using reftest::ServerTest;
using sorvik::PackVersion;
using testsupport::AccessRef;
using testsupport::StoppedCallback;

[[maybe_unused]] const bool g_registry = (reftest::InstallServerRegistry(), true);

bool MutexHeld(std::u16string_view name)
{
    cv::krn::osdep::Mutex mutex(name);
    if (!mutex.TryAcquire())
        return true;
    mutex.Release();
    return false;
}

template <typename Condition>
bool WaitFor(Condition condition, std::chrono::milliseconds within = std::chrono::seconds(10))
{
    const auto deadline = std::chrono::steady_clock::now() + within;
    while (!condition()) {
        if (std::chrono::steady_clock::now() >= deadline)
            return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return true;
}

// The statistics counters of the index status as "name=value" in name order.
std::string CountersIn(const std::filesystem::path &statusFile)
{
    sqlite3 *db = nullptr;
    EXPECT_EQ(sqlite3_open_v2(statusFile.c_str(), &db, SQLITE_OPEN_READONLY, nullptr), SQLITE_OK);
    sqlite3_busy_timeout(db, 5000);
    std::string counters;
    sqlite3_stmt *query = nullptr;
    if (sqlite3_prepare_v2(db,
                           "SELECT name, value FROM counters WHERE name IN ('disk_full_crawl_stop', 'failures', "
                           "'not_my_file') ORDER BY name",
                           -1, &query, nullptr) == SQLITE_OK) {
        while (sqlite3_step(query) == SQLITE_ROW)
            counters += std::string(counters.empty() ? "" : " ") +
                        reinterpret_cast<const char *>(sqlite3_column_text(query, 0)) + '=' +
                        std::to_string(sqlite3_column_int64(query, 1));
    }
    sqlite3_finalize(query);
    sqlite3_close(db);
    return counters;
}

TEST_F(ServerTest, StatisticsComeFromTheIndexStatusAndResetsChangeIt)
{
    auto server = Start({"--portname", "P"}, "P");
    AccessRef access{CreateDirectStoreAccess(u"P", 0)};
    EXPECT_EQ(access->GetElementCount(8), 0u);
    const auto Counters = [this] { return CountersIn(StatusFile()); };

    Sql("INSERT INTO element_counts VALUES (8, 120), (16, 7), (32, 3456);"
        "INSERT INTO parselet_timeouts VALUES ('CSV', 3), ('HDF', 2);"
        "INSERT INTO counters VALUES ('disk_full_crawl_stop', 1), ('failures', 4), ('not_my_file', 5);");
    EXPECT_EQ(access->GetElementCount(8), 120u);
    EXPECT_EQ(access->GetElementCount(16), 7u);
    EXPECT_EQ(access->GetElementCount(32), 3456u);
    EXPECT_EQ(access->GetUserCount(0), 1u);
    EXPECT_TRUE(access->GetDiskIsFullCrawlStop());
    EXPECT_EQ(access->GetFileviewsTimeouted(), 5u);
    std::u16string names[2];
    std::uint32_t counts[2] = {};
    std::uint32_t total = 0;
    access->GetFileviewsTimeoutedPerPlugIn(2, names, counts, &total);
    EXPECT_EQ(total, 2u);
    EXPECT_EQ(names[0], u"CSV");
    EXPECT_EQ(counts[0], 3u);
    EXPECT_EQ(names[1], u"HDF");
    EXPECT_EQ(counts[1], 2u);

    access->ResetIndexStatusTimeouted(); // 18.0.0 no longer knows it
    EXPECT_EQ(access->GetFileviewsTimeouted(), 5u);
    access->ResetIndexStatusFailure();
    EXPECT_EQ(Counters(), "disk_full_crawl_stop=1 failures=0 not_my_file=5");
    access->ResetIndexStatusNotMyFile();
    EXPECT_EQ(Counters(), "disk_full_crawl_stop=1 failures=0 not_my_file=0");
    {
        AccessRef second{CreateDirectStoreAccess(u"P", 0)};
        EXPECT_EQ(second->GetUserCount(0), 2u);
    }
    EXPECT_TRUE(WaitFor([&] { return access->GetUserCount(0) == 1u; })) << "the second user's session ended";

    EXPECT_EQ(server->Stop(SIGTERM), 0);
    EXPECT_FALSE(std::filesystem::exists(testsupport::SorvikProcess::SocketOf("P")));
    EXPECT_FALSE(MutexHeld(InstanceMutexName(u"P")));
}

TEST_F(ServerTest, AStatusStoreThatFailsIsAnsweredWithItsStatusCode)
{
    auto server = Start({"--portname", "P"}, "P");
    cv::util::file::log::ILogImp log;
    PLUGIN::Config config(u"<server>localhost</server><portname>P</portname>");
    RequestorBase requestor(config, log);
    cv::vek::rovo::tRequestTransferData request(config.GetServerVersion(), 5, 4003);
    EXPECT_EQ(cv::vek::rovo::tResponseTransferData(requestor.Exchange(5000, request)).Value(), 0u);

    Sql("DROP TABLE counters");
    cv::vek::rovo::tRequestTransferData again(config.GetServerVersion(), 5, 4003);
    try {
        requestor.Exchange(5000, again);
        ADD_FAILURE() << "answered without its counters";
    } catch (const DataCache::ToIntMsgDa &error) {
        EXPECT_EQ(error.Code(), 181u);
        EXPECT_NE(error.Message().find(u"Failed with error code -500!"), std::u16string::npos);
    }
    cv::vek::rovo::tRequestTransferData elements(config.GetServerVersion(), 5, 4002);
    EXPECT_EQ(cv::vek::rovo::tResponseTransferData(requestor.Exchange(5000, elements)).Value(), 0u)
        << "the rest of the status still answers";
}

TEST_F(ServerTest, OlderServersAreSpokenToInTheirVersion)
{
    {
        auto server = Start({"--portname", "Old", "--version", "3.1.0"}, "Old");
        AccessRef access{CreateDirectStoreAccess(u"Old", 0)};
        EXPECT_EQ(access->GetElementCount(8), 0u);
        EXPECT_EQ(access.Version(), PackVersion(3, 1, 0));
        Sql("INSERT INTO parselet_timeouts VALUES ('CSV', 3)");
        access->ResetIndexStatusTimeouted();
        EXPECT_EQ(access->GetFileviewsTimeouted(), 0u);
    }
    {
        auto server = Start({"--portname", "New", "--version", "19.0.0"}, "New");
        AccessRef access{CreateDirectStoreAccess(u"New", 0)};
        EXPECT_EQ(access->GetElementCount(8), 0u);
        EXPECT_EQ(access.Version(), PackVersion(18, 0, 0)) << "the newest version this client speaks";
        EXPECT_EQ(access->GetElementCount(8), 0u) << "an 18.0.0 request is served";
    }
}

TEST_F(ServerTest, ClientProofIsChecked)
{
    auto server = Start({"--portname", "Id", "--identification", "tool", "--secretkey", "s3cret"}, "Id");
    AccessRef right{CreateDirectStoreAccessWithIdentification(u"Id", 0, u"tool", u"s3cret")};
    EXPECT_EQ(right->GetElementCount(8), 0u);
    AccessRef wrong{CreateDirectStoreAccessWithIdentification(u"Id", 0, u"tool", u"guess")};
    EXPECT_EQ(wrong->GetElementCount(8), IDirectStoreAccess::kFailure);
    AccessRef none{CreateDirectStoreAccess(u"Id", 0)};
    EXPECT_EQ(none->GetElementCount(8), IDirectStoreAccess::kFailure);

    cv::util::file::log::ILogImp log;
    PLUGIN::Config config(u"<server>localhost</server><portname>Id</portname><clientidentificationstring>tool"
                          u"</clientidentificationstring><clientidentificationsecretkey>guess"
                          u"</clientidentificationsecretkey>");
    RequestorBase requestor(config, log);
    try {
        requestor.Connect(false, 3);
        ADD_FAILURE() << "a wrong proof logged on";
    } catch (const DataCache::ToIntMsgDa &error) {
        EXPECT_EQ(error.Code(), 181u);
        const std::u16string &message = error.Message();
        EXPECT_NE(message.find(u"Server Error: Permission denied! Failed with error code -13!"), std::u16string::npos);
    }
}

TEST_F(ServerTest, SecondServerForTheSameInstanceGivesUp)
{
    auto first = Start({"--portname", "P"}, "P");
    testsupport::SorvikProcess second(SORVIK_SERVER, {"--portname", "P"});
    EXPECT_EQ(second.Wait(), 1);
    AccessRef access{CreateDirectStoreAccess(u"P", 0)};
    EXPECT_EQ(access->GetElementCount(8), 0u) << "the first one still serves";
}

TEST_F(ServerTest, StopWaitCallbacksFireWhenTheServerIsKilled)
{
    auto server = Start({"--portname", "P"}, "P");
    StoppedCallback callback;
    AccessRef first{CreateDirectStoreAccess(u"P", 0)};
    AccessRef second{CreateDirectStoreAccess(u"P", 0)};
    first->StartStopWaitThread(&callback);
    second->StartStopWaitThread(&callback);
    EXPECT_FALSE(callback.WaitForCalls(1, std::chrono::milliseconds(200)));

    server->Stop(SIGKILL);
    EXPECT_TRUE(callback.WaitForCalls(2, std::chrono::seconds(10)));
}

TEST_F(ServerTest, LocalServerIsStartedWhenItDoesNotRunAndOnlyThen)
{
    cv::util::file::log::ILogImp log;
    {
        PLUGIN::Config forbidden(u"<server>localhost</server><startengine>no</startengine>");
        RequestorBase requestor(forbidden, log);
        EXPECT_FALSE(requestor.StartServerIfNeeded());
    }
    PLUGIN::Config config(u"<server>localhost</server>");
    RequestorBase requestor(config, log);
    ASSERT_TRUE(requestor.StartServerIfNeeded());
    ASSERT_TRUE(WaitFor([] { return MutexHeld(kGlobalServerMutexName); })) << "the started server took its mutex";
    const pid_t pid = StartedServerPid();
    ASSERT_GT(pid, 0);

    RequestorBase another(config, log);
    EXPECT_FALSE(another.StartServerIfNeeded()) << "a server holds the global mutex";
    cv::vek::rovo::tRequestTransferData request(config.GetServerVersion(), 5, 4002);
    request.Arguments()[2] = 8;
    EXPECT_EQ(cv::vek::rovo::tResponseTransferData(another.Exchange(5000, request)).Value(), 0u);

    ::kill(pid, SIGTERM);
    EXPECT_TRUE(WaitFor([] { return !MutexHeld(kGlobalServerMutexName); }));
}

TEST_F(ServerTest, LocalServerThatCannotBeStartedIsReported)
{
    std::ofstream(m_dir.file("registry.ini"))
        << "[Software\\Corvane\\Common\\SorvikDesktop]\nbinDir=" << m_dir.file("nothing-here").string() << "\n";
    testsupport::ScopedEnv registry("CORVANE_REGISTRY", m_dir.file("registry.ini").string());
    cv::util::file::log::ILogImp log;
    PLUGIN::Config config(u"<server>localhost</server>");
    RequestorBase requestor(config, log);
    try {
        requestor.StartServerIfNeeded();
        ADD_FAILURE() << "started";
    } catch (const DataCache::ToIntMsgDa &error) {
        EXPECT_EQ(error.Code(), 65u);
        EXPECT_NE(error.Message().find(u"PLUGIN: Sorvik is not running and the plugin is not able to start it!"),
                  std::u16string::npos);
    }
}

std::string FileText(const std::filesystem::path &file)
{
    std::ifstream in(file);
    return std::string(std::istreambuf_iterator<char>(in), {});
}

TEST_F(ServerTest, StatsCommandPrintsEveryStatisticAndWaitsForTheEnd)
{
    auto server = Start({"--portname", "S"}, "S");
    Sql("INSERT INTO element_counts VALUES (8, 120); INSERT INTO parselet_timeouts VALUES ('CSV', 3)");
    // An administrator's check works where there is no display.
    testsupport::ScopedEnv noPlatform("QT_QPA_PLATFORM", std::nullopt), noDisplay("DISPLAY", std::nullopt),
        noWayland("WAYLAND_DISPLAY", std::nullopt);

    testsupport::SorvikProcess stats(SORVIK_HOST, {"stats", "--portname", "S"}, m_dir.file("stats.out"));
    EXPECT_EQ(stats.Wait(std::chrono::seconds(30)), 0);
    EXPECT_EQ(FileText(m_dir.file("stats.out")), "GetUserCount(0): 1\n"
                                                 "GetElementCount(8): 120\n"
                                                 "GetElementCount(16): 0\n"
                                                 "GetElementCount(32): 0\n"
                                                 "GetDiskIsFullCrawlStop: false\n"
                                                 "GetFileviewsTimeouted: 3\n"
                                                 "GetFileviewsTimeoutedPerPlugIn: 1\n"
                                                 "GetFileviewsTimeoutedPerPlugIn(CSV): 3\n");

    testsupport::SorvikProcess waiting(SORVIK_HOST, {"stats", "--portname", "S", "--wait"}, m_dir.file("wait.out"));
    ASSERT_TRUE(WaitFor([&] { return FileText(m_dir.file("wait.out")).find("PerPlugIn(CSV)") != std::string::npos; },
                        std::chrono::seconds(30)));
    EXPECT_EQ(waiting.Wait(std::chrono::milliseconds(300)), -1) << "it waits while the server runs";
}

TEST_F(ServerTest, StatsCommandEndsWhenTheServerDoes)
{
    auto server = Start({"--portname", "S"}, "S");
    testsupport::SorvikProcess waiting(SORVIK_HOST, {"stats", "--portname", "S", "--wait"}, m_dir.file("wait.out"));
    ASSERT_TRUE(WaitFor([&] { return FileText(m_dir.file("wait.out")).find("PerPlugIn") != std::string::npos; },
                        std::chrono::seconds(30)));
    server->Stop(SIGTERM);
    EXPECT_EQ(waiting.Wait(std::chrono::seconds(10)), 0);
    EXPECT_NE(FileText(m_dir.file("wait.out")).find("stopped: S"), std::string::npos);

    testsupport::ScopedEnv connectWindow("CORVANE_COMM_CONNECT_WAIT_MS", "0");
    testsupport::SorvikProcess unanswered(SORVIK_HOST, {"stats", "--portname", "S"});
    EXPECT_EQ(unanswered.Wait(std::chrono::seconds(30)), 3) << "nobody answers any more";
}

// What `out=$(sorvik-config stats)` does: read the client's output until
// every writer of the pipe is gone.
std::string ReadUntilEndOfFile(int fd, std::chrono::milliseconds within, bool &ended)
{
    const auto deadline = std::chrono::steady_clock::now() + within;
    std::string text;
    ended = false;
    for (;;) {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
        pollfd entry{fd, POLLIN, 0};
        if (left.count() <= 0 || ::poll(&entry, 1, int(left.count())) <= 0)
            return text;
        char buffer[4096];
        const ssize_t got = ::read(fd, buffer, sizeof buffer);
        if (got <= 0) {
            ended = got == 0;
            return text;
        }
        text.append(buffer, std::size_t(got));
    }
}

TEST_F(ServerTest, AClientsOutputEndsWithTheClientWhileTheServerItStartedRuns)
{
    int output[2];
    ASSERT_EQ(::pipe2(output, O_CLOEXEC), 0);
    const pid_t client = ::fork();
    ASSERT_GE(client, 0);
    if (client == 0) {
        ::dup2(output[1], STDOUT_FILENO);
        ::dup2(output[1], STDERR_FILENO);
        ::execl(SORVIK_HOST, "sorvik-config", "stats", static_cast<char *>(nullptr));
        ::_exit(127);
    }
    ::close(output[1]);
    bool ended = false;
    const std::string text = ReadUntilEndOfFile(output[0], std::chrono::seconds(30), ended);
    ::close(output[0]);
    int status = -1;
    ::waitpid(client, &status, 0);

    EXPECT_TRUE(ended) << "the output of the client stayed open";
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << text;
    EXPECT_NE(text.find("GetUserCount(0): 1\n"), std::string::npos) << text;
    EXPECT_TRUE(MutexHeld(kGlobalServerMutexName)) << "the server the client started still runs";

    // Its output went to a log of its own, for its owner's eyes only.
    const auto log = m_dir.path() / "run" / "Sorvik.log";
    struct stat logStatus = {};
    EXPECT_EQ(::stat(log.c_str(), &logStatus), 0);
    EXPECT_EQ(logStatus.st_mode & 0777, 0600u);
    EXPECT_NE(FileText(log).find("logged on: (anonymous)"), std::string::npos);

    ::kill(StartedServerPid(), SIGTERM);
    EXPECT_TRUE(WaitFor([] { return !MutexHeld(kGlobalServerMutexName); }));
}

bool Holds(const std::string &bytes, const std::string &secret)
{
    std::string utf16;
    for (const char c : secret)
        utf16 += {c, '\0'};
    return bytes.find(secret) != std::string::npos || bytes.find(utf16) != std::string::npos;
}

TEST_F(ServerTest, TheSecretKeyAppearsInNoLogLineAndNoErrorText)
{
    const std::string secret = "Zq7-secret-Key-4711";
    auto server = Start({"--portname", "Id", "--identification", "tool", "--secretkey", secret}, "Id",
                        m_dir.file("server.out"));
    const auto logFile = m_dir.file("client.log");
    std::vector<std::string> errors;
    const auto exchange = [&](const std::string &key) {
        // Every verbosity, every prefix, into the file.
        const std::string settings = "<server>localhost</server><portname>Id</portname>"
                                     "<logfile bitmask=\"0xFFFFFFFF\" outbitmask=\"0xC0000002\">" +
                                     logFile.string() +
                                     "</logfile><clientidentificationstring>tool</clientidentificationstring>"
                                     "<clientidentificationsecretkey>" +
                                     key + "</clientidentificationsecretkey>";
        cv::util::file::log::ILogImp log;
        PLUGIN::Config config(cv::krn::ToUtf16(settings), log);
        RequestorBase requestor(config, log);
        cv::vek::rovo::tRequestTransferData request(config.GetServerVersion(), 5, 4001);
        try {
            requestor.Exchange(5000, request);
            return true;
        } catch (const DataCache::ToIntMsgDa &error) {
            errors.push_back(cv::krn::ToUtf8(error.Message()));
            return false;
        }
    };

    EXPECT_TRUE(exchange(secret));
    EXPECT_FALSE(exchange(secret + "x")) << "a wrong key is refused";
    server->Stop(SIGTERM);
    EXPECT_FALSE(exchange(secret)) << "nobody answers";

    ASSERT_EQ(errors.size(), 2u);
    for (const std::string &error : errors)
        EXPECT_FALSE(Holds(error, secret)) << error;
    const std::string logged = FileText(logFile);
    EXPECT_NE(logged.find(std::string("P\0e\0r\0m\0i\0s\0s\0i\0o\0n\0", 20)), std::string::npos)
        << "the log holds the exchange";
    EXPECT_FALSE(Holds(logged, secret));
    EXPECT_FALSE(Holds(FileText(m_dir.file("server.out")), secret));
}

} // namespace
