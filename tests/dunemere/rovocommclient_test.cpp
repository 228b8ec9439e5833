#include "peerprocess.h"

#include "dunemere/rovocommclient.h"
#include "dunemere/tointmsgda.h"
#include "krn/utf.h"
#include "reference/comm/listener.h"
#include "sorvik/rovocomm.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <regex>
#include <string>
#include <system_error>
#include <vector>

namespace {

using namespace cv::vek::rovo::comm;
using cv::krn::ByteBuffer;
using cv::krn::WString;
using PLUGIN::rovoCommClient;
using testsupport::PeerProcess;

constexpr const char *kPeer = SORVIK_COMM_PEER;

void WriteRegistry(const std::filesystem::path &file, const std::string &binDir)
{
    std::ofstream(file) << "[Software\\Corvane\\Common\\Sorvik]\nbinDir=" << binDir << "\n";
}

// The process's registry names the reference comm library; it is fixed
// before any test asks for the library's path, which is kept for good.
class CommRegistry : public ::testing::Environment
{
public:
    void SetUp() override
    {
        m_dir = std::make_unique<testsupport::TempDir>();
        WriteRegistry(m_dir->file("registry.ini"), SORVIK_COMM_LIBRARY_DIR);
        m_env = std::make_unique<testsupport::ScopedEnv>("CORVANE_REGISTRY", m_dir->file("registry.ini").string());
    }
    void TearDown() override
    {
        m_env.reset();
        m_dir.reset();
    }

private:
    std::unique_ptr<testsupport::TempDir> m_dir;
    std::unique_ptr<testsupport::ScopedEnv> m_env;
};

[[maybe_unused]] ::testing::Environment *const g_registry = ::testing::AddGlobalTestEnvironment(new CommRegistry);

ByteBuffer Bytes(std::size_t size)
{
    ByteBuffer buffer;
    buffer.resize(size);
    for (std::size_t i = 0; i < size; ++i)
        buffer.data()[i] = static_cast<std::uint8_t>(i ^ (i >> 9));
    return buffer;
}

// A peer process serving one local service in a runtime folder of its own.
class WithPeer : public ::testing::Test
{
protected:
    std::unique_ptr<PeerProcess> StartPeer(const std::string &behaviour)
    {
        auto peer = std::make_unique<PeerProcess>(kPeer, std::vector<std::string>{"serve", "P", "C", behaviour},
                                                  PeerProcess::Environment{{"CORVANE_RUNTIME_DIR", dir.path().string()}});
        EXPECT_EQ(peer->ReadLine(), "ready");
        return peer;
    }
    std::unique_ptr<rovoCommClient> Connect()
    {
        return rovoCommClient::Create(WString(u"localhost"), WString(u"P"), WString(u"C"));
    }

    testsupport::TempDir dir;
    testsupport::ScopedEnv runtime{"CORVANE_RUNTIME_DIR", dir.path().string()};
};

TEST_F(WithPeer, RecordsArriveWhole)
{
    const auto peer = StartPeer("echo");
    {
        const auto client = Connect();
        ClientSocket &socket = client->Socket();
        for (const std::size_t size : {std::size_t(0), std::size_t(1), std::size_t(1000), std::size_t(6 * 1024 * 1024 + 3)}) {
            ByteBuffer sent = Bytes(size);
            ASSERT_EQ(socket.Send(sent, 10000), kResultOk) << size;
            ByteBuffer received;
            ASSERT_EQ(socket.Receive(received, 10000), kResultOk) << size;
            ASSERT_EQ(received.size(), size);
            EXPECT_TRUE(std::equal(sent.data(), sent.data() + size, received.data())) << size;
        }
        // A time-out of 0 stands for the socket's own.
        EXPECT_EQ(socket.SetTimeout(5000), kResultOk);
        ByteBuffer small = Bytes(10);
        ASSERT_EQ(socket.Send(small, 0), kResultOk);
        ByteBuffer received;
        ASSERT_EQ(socket.Receive(received, 0), kResultOk);
        EXPECT_EQ(received.size(), 10u);
    }
    EXPECT_EQ(peer->Finish(), 0);
}

TEST_F(WithPeer, ASilentPeerTimesOut)
{
    const auto peer = StartPeer("silent");
    {
        const auto client = Connect();
        ByteBuffer received;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(client->Socket().Receive(received, 150), kResultTimeout);
        EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(150));
        // Still connected: a time-out loses nothing.
        ByteBuffer request = Bytes(4);
        EXPECT_EQ(client->Socket().Send(request, 1000), kResultOk);
    }
    EXPECT_EQ(peer->Finish(), 0);
}

TEST_F(WithPeer, APeerThatDiesMidRecordIsALostConnection)
{
    const auto peer = StartPeer("die");
    const auto client = Connect();
    ByteBuffer request = Bytes(16);
    ASSERT_EQ(client->Socket().Send(request, 10000), kResultOk);
    ByteBuffer received;
    EXPECT_EQ(client->Socket().Receive(received, 10000), kResultConnectionLost);
    EXPECT_EQ(client->Socket().Send(request, 1000), kResultConnectionLost);
    EXPECT_EQ(peer->Finish(), 0);
}

TEST_F(WithPeer, AnOversizedRecordIsRefusedAndTheConnectionDropped)
{
    const auto peer = StartPeer("oversize");
    const auto client = Connect();
    ByteBuffer request = Bytes(16);
    ASSERT_EQ(client->Socket().Send(request, 10000), kResultOk);
    ByteBuffer received;
    EXPECT_EQ(client->Socket().Receive(received, 10000), kResultFrameTooLarge);
    EXPECT_EQ(peer->ReadLine(), "closed"); // the peer saw the connection go
    EXPECT_EQ(client->Socket().Receive(received, 1000), kResultConnectionLost);
    EXPECT_EQ(peer->Finish(), 0);
}

TEST(CommLibraryPath, IsFoundOnceAndKept)
{
    const std::u16string first = PLUGIN::CommLibraryPath();
    const std::string folder = SORVIK_COMM_LIBRARY_DIR;
    EXPECT_EQ(first, std::u16string(folder.begin(), folder.end()) + u"/librovoCommVelosCompatWrapper.so");

    testsupport::TempDir dir;
    std::ofstream(dir.file("registry.ini")) << "[Software\\Corvane\\Common\\Sorvik]\nbinDir=/elsewhere\n"
                                               "[Software\\Corvane\\Common\\Sorvik\\ConfigItems]\nrovoCommDllClient=libother.so\n";
    testsupport::ScopedEnv registry("CORVANE_REGISTRY", dir.file("registry.ini").string());
    EXPECT_EQ(PLUGIN::FindCommLibrary(), u"/elsewhere/libother.so");
    EXPECT_EQ(PLUGIN::CommLibraryPath(), first);
}

// Each case runs in a process of its own, since the library's path is found
// once per process.
class ConnectionErrors : public ::testing::Test
{
protected:
    // Nobody listening is given up on after connectWindow milliseconds.
    std::pair<std::string, std::string> Attempt(const std::string &binDir, const std::string &name = "P",
                                                const std::string &connectWindow = "300")
    {
        WriteRegistry(dir.file("registry.ini"), binDir);
        PeerProcess probe(kPeer, {"connect", "localhost", name, "C"},
                          {{"CORVANE_REGISTRY", dir.file("registry.ini").string()},
                           {"CORVANE_RUNTIME_DIR", dir.path().string()},
                           {"CORVANE_COMM_CONNECT_WAIT_MS", connectWindow}});
        const std::string code = probe.ReadLine().value_or("no answer");
        const std::string message = probe.ReadLine().value_or("");
        EXPECT_EQ(probe.Finish(), 0);
        return {code, message};
    }
    static std::string Expected(const std::string &code, const std::string &text)
    {
        return "rovoCommClient\\([0-9]+\\): ERROR\\(" + code + "\\): " + text;
    }

    testsupport::TempDir dir;
};

TEST_F(ConnectionErrors, AMissingLibrary)
{
    const auto [code, message] = Attempt(dir.path().string());
    EXPECT_EQ(code, "65");
    EXPECT_TRUE(std::regex_match(message, std::regex(Expected("65", "SKCP:     Unable to load Comm library!"))))
        << message;
}

TEST_F(ConnectionErrors, ALibraryWithoutTheExport)
{
    const auto [code, message] = Attempt(SORVIK_NOEXPORT_LIBRARY_DIR);
    EXPECT_EQ(code, "65");
    EXPECT_TRUE(
        std::regex_match(message, std::regex(Expected("65", "SKCP:     Cannot find NewClientSocket function!"))))
        << message;
}

TEST_F(ConnectionErrors, NobodyListening)
{
    const auto start = std::chrono::steady_clock::now();
    const auto [code, message] = Attempt(SORVIK_COMM_LIBRARY_DIR, "Nobody");
    EXPECT_EQ(code, "65");
    EXPECT_TRUE(std::regex_match(message, std::regex(Expected("65", "SKCP:     Unable to connect to socket!"))))
        << message;
    // A local server gets the connect window to come up before the attempt fails.
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(250));
}

TEST_F(ConnectionErrors, ConnectsWhenTheServiceListens)
{
    PeerProcess peer(kPeer, {"serve", "P", "C", "silent"}, {{"CORVANE_RUNTIME_DIR", dir.path().string()}});
    ASSERT_EQ(peer.ReadLine(), "ready");
    EXPECT_EQ(Attempt(SORVIK_COMM_LIBRARY_DIR).first, "connected");
    EXPECT_EQ(peer.Finish(), 0);
}

// Somebody who can put a socket where the client looks could stand in for
// the server and collect what clients send.
class UntrustedServer : public ::testing::Test
{
protected:
    std::string Outcome()
    {
        try {
            rovoCommClient::Create(WString(u"localhost"), WString(u"P"), WString(u"C"));
            return "connected";
        } catch (const DataCache::ToIntMsgDa &error) {
            return cv::krn::ToUtf8(error.Message());
        }
    }
    static std::string ListenerRefusal(std::u16string_view name)
    {
        try {
            Listener().ListenLocal(name, u"C");
            return "listening";
        } catch (const std::system_error &error) {
            EXPECT_EQ(error.code().value(), EACCES);
            return error.what();
        }
    }
    std::filesystem::path Run() const { return dir.path() / "run"; }

    testsupport::TempDir dir;
    testsupport::ScopedEnv runtime{"CORVANE_RUNTIME_DIR", Run().string()};
};

TEST_F(UntrustedServer, AFolderOthersMayChangeIsRefusedOnBothSides)
{
    Listener listener;
    listener.ListenLocal(u"P", u"C");
    EXPECT_EQ(Outcome(), "connected");

    ASSERT_EQ(::chmod((Run() / "C").c_str(), 0777), 0);
    const std::string message = Outcome();
    EXPECT_NE(message.find("SKCP:     Unable to connect to socket! refused the local server at \"" +
                           (Run() / "C" / "P.sock").string() + "\""),
              std::string::npos)
        << message;
    EXPECT_NE(message.find("may be changed by other users"), std::string::npos) << message;
    EXPECT_NE(ListenerRefusal(u"Q").find("may be changed by other users"), std::string::npos);
}

TEST_F(UntrustedServer, ASocketOrFolderOfAnotherUserIsRefused)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can give a file to another user";
    constexpr uid_t kNobody = 65534;
    Listener listener;
    listener.ListenLocal(u"P", u"C");
    const auto socket = Run() / "C" / "P.sock";

    ASSERT_EQ(::chown(socket.c_str(), kNobody, kNobody), 0);
    std::string message = Outcome();
    EXPECT_NE(message.find("\"" + socket.string() + "\" belongs to user 65534"), std::string::npos) << message;

    ASSERT_EQ(::chown(socket.c_str(), 0, 0), 0);
    EXPECT_EQ(Outcome(), "connected");
    ASSERT_EQ(::chown(Run().c_str(), kNobody, kNobody), 0);
    message = Outcome();
    EXPECT_NE(message.find("\"" + Run().string() + "\" belongs to user 65534"), std::string::npos) << message;
    EXPECT_NE(ListenerRefusal(u"Q").find("belongs to user 65534"), std::string::npos);
}

} // namespace
