#include "protocolfixture.h"

#include "dunemere/directstoreaccess.h"
#include "dunemere/instancenames.h"
#include "dunemere/stopwaitthread.h"
#include "sorvik/packedversion.h"
#include "sorvik/vekexception.h"
#include "support/directstoreaccessref.h"
#include "support/scriptedserver.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <set>
#include <thread>

namespace {

using namespace cv::vek::rovo::dunemere;
using sorvik::PackVersion;
using testsupport::AccessRef;
using testsupport::ScriptedServer;
using testsupport::StoppedCallback;

[[maybe_unused]] const bool g_registry = (testsupport::InstallCommRegistry(), true);

constexpr std::uint32_t kFailure = IDirectStoreAccess::kFailure;

std::set<std::uint32_t> CodesReceived(const ScriptedServer &server)
{
    std::set<std::uint32_t> codes;
    for (const auto &request : server.Received())
        if (request.category == 5)
            codes.insert(request.code);
    return codes;
}

using DirectStoreAccessTest = testsupport::ProtocolTest;

struct Gates
{
    std::uint32_t version;
    std::set<std::uint32_t> sent; // besides 4001, which negotiates the version
};

class VersionGates : public DirectStoreAccessTest, public ::testing::WithParamInterface<Gates>
{
};

TEST_P(VersionGates, OperationsAreSentOnlyToServersThatKnowThem)
{
    ScriptedServer server(u"P", ScriptedServer::Serving(GetParam().version, [](const auto &) { return 0u; }));
    AccessRef access{CreateDirectStoreAccess(u"P", 0)};

    ASSERT_EQ(access->GetUserCount(0), 0u);
    access->GetDiskIsFullCrawlStop();
    access->GetFileviewsTimeouted();
    std::uint32_t total = 77;
    access->GetFileviewsTimeoutedPerPlugIn(0, nullptr, nullptr, &total);
    access->ResetIndexStatusTimeouted();
    access->ResetIndexStatusFailure();
    access->ResetIndexStatusNotMyFile();

    auto expected = GetParam().sent;
    expected.insert(4001);
    EXPECT_EQ(CodesReceived(server), expected);
}

INSTANTIATE_TEST_SUITE_P(
    Servers, VersionGates,
    ::testing::Values(Gates{PackVersion(1, 5, 0), {}},
                      Gates{PackVersion(2, 0, 3), {4003, 4005, 4006, 4007, 4008}},
                      Gates{PackVersion(3, 1, 1), {4003, 4005, 4006, 4007, 4008, 4009}},
                      Gates{PackVersion(3, 2, 0), {4003, 4005, 4006, 4008, 4009}},
                      Gates{PackVersion(18, 0, 0), {4003, 4005, 4006, 4008, 4009}}),
    [](const ::testing::TestParamInfo<Gates> &info) {
        const std::uint32_t version = info.param.version;
        return "server_" + std::to_string(sorvik::VersionMajor(version)) + '_' +
               std::to_string(sorvik::VersionMinor(version)) + '_' + std::to_string(sorvik::VersionPatch(version));
    });

TEST_F(DirectStoreAccessTest, RequestsCarryTheirArgumentWordAndIdentification)
{
    ScriptedServer server(u"P", ScriptedServer::Serving(PackVersion(18, 0, 0), [](const ScriptedServer::Request &r) {
        return r.arguments[0] + r.arguments[2] * 10;
    }));
    AccessRef access{CreateDirectStoreAccessWithIdentification(u"P", 1, u"tool", u"key")};

    EXPECT_EQ(access->GetUserCount(4), 4u);
    EXPECT_EQ(access->GetElementCount(32), 320u);
    const auto permission = server.Received().front();
    ASSERT_EQ(permission.parameters.size(), 2u);
    EXPECT_EQ(permission.parameters[0], u"tool");
    EXPECT_FALSE(permission.parameters[1].empty());
}

TEST_F(DirectStoreAccessTest, PerPlugInTextFillsWhatItCanAndZeroesMalformedEntries)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &request, ScriptedServer::Peer &peer) {
        if (request.category == 4)
            peer.Send(ScriptedServer::Data(request.id, 0));
        else
            peer.Send(ScriptedServer::Data(request.id, 0, 2, u"a$3;b$x$y;"));
    });
    AccessRef access{CreateDirectStoreAccess(u"P", 0)};

    std::u16string names[2] = {u"keep0", u"keep1"};
    std::uint32_t counts[2] = {9, 9};
    std::uint32_t total = 0;
    access->GetFileviewsTimeoutedPerPlugIn(2, names, counts, &total);
    EXPECT_EQ(total, 2u);
    EXPECT_EQ(names[0], u"a");
    EXPECT_EQ(counts[0], 3u);
    EXPECT_EQ(names[1], u"keep1");
    EXPECT_EQ(counts[1], 0u);
    EXPECT_EQ(server.Received().back().arguments[0], 2u) << "capacity goes in word 0";
}

TEST(SpreadPerPlugInText, EntriesBeyondTotalCapacityOrTextAreLeftAlone)
{
    std::u16string names[3] = {u"x", u"y", u"z"};
    std::uint32_t counts[3] = {7, 7, 7};
    SpreadPerPlugInText(u";;p$12;;", 3, 3, names, counts);
    EXPECT_EQ(names[0], u"p");
    EXPECT_EQ(counts[0], 12u);
    EXPECT_EQ(counts[1], 7u) << "the text has one entry only";

    SpreadPerPlugInText(u"a$1;b$2;", 1, 3, names, counts);
    EXPECT_EQ(names[1], u"y") << "total bounds the entries read";
}

TEST_F(DirectStoreAccessTest, FailuresGiveTheFailureValuesAndNeverRaise)
{
    ScriptedServer server(u"P", [](const ScriptedServer::Request &, ScriptedServer::Peer &peer) { peer.Drop(); });
    AccessRef access{CreateDirectStoreAccess(u"P", 0)};

    EXPECT_EQ(access->GetUserCount(0), kFailure);
    EXPECT_EQ(access->GetElementCount(8), kFailure);
    EXPECT_FALSE(access->GetDiskIsFullCrawlStop());
    EXPECT_EQ(access->GetFileviewsTimeouted(), kFailure);
    std::u16string name = u"kept";
    std::uint32_t count = 5, total = 6;
    access->GetFileviewsTimeoutedPerPlugIn(1, &name, &count, &total);
    EXPECT_EQ(name, u"kept");
    EXPECT_EQ(count, 5u);
    EXPECT_EQ(total, 6u);
    access->ResetIndexStatusFailure();
}

TEST_F(DirectStoreAccessTest, UnreachableInstanceGivesTheFailureValue)
{
    testsupport::ScopedEnv connectWindow("CORVANE_COMM_CONNECT_WAIT_MS", "0");
    AccessRef access{CreateDirectStoreAccess(u"Nobody", 0)};
    EXPECT_EQ(access->GetElementCount(8), kFailure);
}

TEST_F(DirectStoreAccessTest, QueryInterfaceAnswersItsOwnInterfaceAndIUnknownOnly)
{
    AccessRef access{CreateDirectStoreAccess(u"P", 0)};
    void *object = nullptr;
    ASSERT_EQ(access->QueryInterface(IID_IDirectStoreAccess, &object), S_OK);
    EXPECT_EQ(object, access.access);
    EXPECT_EQ(access->Release(), 1u);
    ASSERT_EQ(access->QueryInterface(IID_IUnknown, &object), S_OK);
    EXPECT_EQ(access->Release(), 1u);

    object = &object;
    EXPECT_EQ(access->QueryInterface(MakeGuid("{00000000-0000-0000-0000-000000000001}"), &object), E_NOINTERFACE);
    EXPECT_EQ(object, nullptr);
}

TEST(DirectStoreAccessSettings, SettingsTextNamesTheLocalInstanceAndTheIdentification)
{
    EXPECT_EQ(CDirectStoreAccess::SettingsText(u"P1"), u"<server>localhost</server><portname>P1</portname>");
    EXPECT_EQ(CDirectStoreAccess::SettingsText(u"P1", u"id", u"k"),
              u"<server>localhost</server><portname>P1</portname><clientidentificationstring>id"
              u"</clientidentificationstring><clientidentificationsecretkey>k</clientidentificationsecretkey>");
}

TEST_F(DirectStoreAccessTest, StopWaitThreadCallsBackWhenTheInstanceEndsAndHoldsItsCallback)
{
    StoppedCallback callback;
    auto instance = OpenInstanceMutex(u"P");
    ASSERT_TRUE(instance->TryAcquire());
    {
        AccessRef first{CreateDirectStoreAccess(u"P", 0)};
        AccessRef second{CreateDirectStoreAccess(u"P", 0)};
        first->StartStopWaitThread(&callback);
        second->StartStopWaitThread(&callback);
        EXPECT_EQ(callback.References(), 3u);
        EXPECT_FALSE(callback.WaitForCalls(1, std::chrono::milliseconds(100))) << "the instance still runs";

        instance->Release();
        EXPECT_TRUE(callback.WaitForCalls(2, std::chrono::seconds(10))) << "both threads are told";
    }
    EXPECT_EQ(callback.References(), 1u);
    EXPECT_EQ(callback.Calls(), 2);
}

TEST_F(DirectStoreAccessTest, StopWaitThreadForAnInstanceThatDoesNotRunCallsBackAtOnce)
{
    StoppedCallback callback;
    auto *thread = new CStopWaitThread(u"NotRunning", &callback);
    EXPECT_TRUE(callback.WaitForCalls(1, std::chrono::seconds(10)));
    void *object = &object;
    EXPECT_EQ(thread->QueryInterface(IID_IUnknown, &object), E_NOINTERFACE);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(thread->Release(), 0u);
    EXPECT_EQ(callback.References(), 1u);
}

} // namespace
