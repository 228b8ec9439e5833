#include "allocationwatch.h"

#include "reference/comm/connector.h"
#include "reference/comm/endpoint.h"
#include "reference/comm/framedsocket.h"
#include "reference/comm/listener.h"
#include "sorvik/rovocomm.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <fstream>
#include <optional>
#include <string>
#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <system_error>
#include <thread>
#include <unistd.h>
#include <variant>
#include <vector>

namespace {

using namespace cv::vek::rovo::comm;
using cv::krn::ByteBuffer;

std::string Frame(std::string_view payload, std::uint32_t announced)
{
    std::string frame(4, '\0');
    for (int i = 0; i < 4; ++i)
        frame[i] = static_cast<char>(announced >> (8 * i));
    return frame.append(payload);
}

std::string Frame(std::string_view payload)
{
    return Frame(payload, static_cast<std::uint32_t>(payload.size()));
}

std::string Text(const ByteBuffer &buffer)
{
    return std::string(reinterpret_cast<const char *>(buffer.data()), buffer.size());
}

std::vector<std::uint8_t> Pattern(std::size_t size)
{
    std::vector<std::uint8_t> bytes(size);
    for (std::size_t i = 0; i < size; ++i)
        bytes[i] = static_cast<std::uint8_t>(i * 7 + i / 251);
    return bytes;
}

// One end framed, the other raw, so a test writes exactly the bytes it means.
class FramedPair : public ::testing::Test
{
protected:
    void SetUp() override
    {
        int fds[2];
        ASSERT_EQ(::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, fds), 0);
        framed = std::make_unique<FramedSocket>(fds[0]);
        raw = fds[1];
        // A write that does not fit fails the test instead of hanging it.
        ::fcntl(raw, F_SETFL, O_NONBLOCK);
    }
    void TearDown() override
    {
        if (raw >= 0)
            ::close(raw);
    }
    void Write(const std::string &bytes) { ASSERT_EQ(::write(raw, bytes.data(), bytes.size()), ssize_t(bytes.size())); }
    void HangUp()
    {
        ::close(raw);
        raw = -1;
    }

    std::unique_ptr<FramedSocket> framed;
    int raw = -1;
    ByteBuffer received;
};

TEST_F(FramedPair, ReceivesOneRecordPerCall)
{
    received.append("old", 3);
    Write(Frame("first") + Frame("") + Frame("third"));
    ASSERT_EQ(framed->Receive(received, 1000), kResultOk);
    EXPECT_EQ(Text(received), "first");
    ASSERT_EQ(framed->Receive(received, 1000), kResultOk);
    EXPECT_EQ(Text(received), "");
    ASSERT_EQ(framed->Receive(received, 1000), kResultOk);
    EXPECT_EQ(Text(received), "third");
    EXPECT_EQ(framed->Receive(received, 0), kResultTimeout);
}

TEST_F(FramedPair, RecordsAcrossEveryReadBoundaryArriveWhole)
{
    // Sizes around the socket's read-ahead put a header across the end of one
    // read, and a large payload partly in the read-ahead, partly behind it.
    const std::vector<std::size_t> sizes = {4090, 1, 4088, 100000, 0, 4096, 3, 5000};
    std::string stream;
    for (const std::size_t size : sizes)
        stream += Frame(std::string(size, char('a' + size % 26)));
    for (std::size_t at = 0; at < stream.size(); at += 60000)
        Write(stream.substr(at, 60000));
    for (const std::size_t size : sizes) {
        ASSERT_EQ(framed->Receive(received, 1000), kResultOk) << size;
        EXPECT_EQ(Text(received), std::string(size, char('a' + size % 26)));
    }
    EXPECT_EQ(framed->Receive(received, 0), kResultTimeout);
}

TEST_F(FramedPair, ARecordCutShortIsCompletedByTheNextCall)
{
    const std::string frame = Frame("split record");
    for (std::size_t cut : {1u, 3u, 4u, 5u, 10u}) {
        Write(frame.substr(0, cut));
        EXPECT_EQ(framed->Receive(received, 0), kResultTimeout) << cut;
        Write(frame.substr(cut));
        ASSERT_EQ(framed->Receive(received, 1000), kResultOk) << cut;
        EXPECT_EQ(Text(received), "split record");
    }
}

TEST_F(FramedPair, APeerGoneMidFrameIsALostConnection)
{
    Write(Frame("0123456789", 100));
    HangUp();
    EXPECT_EQ(framed->Receive(received, 1000), kResultConnectionLost);
    EXPECT_FALSE(framed->IsOpen());
    EXPECT_EQ(framed->Send(std::span<const std::uint8_t>(), 1000), kResultConnectionLost);
}

TEST_F(FramedPair, SendingToAGonePeerReportsLossWithoutASignal)
{
    HangUp();
    const std::vector<std::uint8_t> record = Pattern(100);
    EXPECT_EQ(framed->Send(record, 1000), kResultConnectionLost);
}

TEST_F(FramedPair, AnOversizedFrameIsRefusedWithoutAllocatingIt)
{
    testsupport::ResetLargestAllocation();
    Write(Frame("garbage", 0xFFFFFFF0u));
    EXPECT_EQ(framed->Receive(received, 1000), kResultFrameTooLarge);
    EXPECT_LT(testsupport::LargestAllocation(), 1024u * 1024u);
    EXPECT_FALSE(framed->IsOpen());
    EXPECT_EQ(framed->Receive(received, 1000), kResultConnectionLost);

    // Larger than the limit is refused on the way out too, and nothing leaves.
    int fds[2];
    ASSERT_EQ(::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, fds), 0);
    FramedSocket sender(fds[0]);
    const std::vector<std::uint8_t> huge(kMaxFrameBytes + 1);
    EXPECT_EQ(sender.Send(huge, 1000), kResultFrameTooLarge);
    EXPECT_TRUE(sender.IsOpen());
    ::close(fds[1]);
}

TEST_F(FramedPair, StorageGrowsWithWhatArrivesNotWithWhatIsAnnounced)
{
    const std::string large(100 * 1024, 'a'); // more than one step of growth
    Write(Frame(large));
    testsupport::ResetLargestAllocation();
    ASSERT_EQ(framed->Receive(received, 1000), kResultOk);
    EXPECT_GE(testsupport::LargestAllocation(), large.size());
    EXPECT_EQ(Text(received), large);

    testsupport::ResetLargestAllocation();
    Write(Frame("only a little", kMaxFrameBytes));
    EXPECT_EQ(framed->Receive(received, 0), kResultTimeout);
    EXPECT_LT(testsupport::LargestAllocation(), 1024u * 1024u);
}

TEST_F(FramedPair, ASendThatTimesOutMidFrameClosesTheSocket)
{
    // Nobody reads the raw end, so a record larger than the socket buffers stalls.
    const std::vector<std::uint8_t> record = Pattern(8 * 1024 * 1024);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(framed->Send(record, 100), kResultTimeout);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(100));
    EXPECT_FALSE(framed->IsOpen());
    EXPECT_EQ(framed->Send(record, 100), kResultConnectionLost);
}

class Resolution : public ::testing::Test
{
protected:
    testsupport::TempDir dir;
    testsupport::ScopedEnv runtime{"CORVANE_RUNTIME_DIR", dir.path().string()};
    testsupport::ScopedEnv registry{"CORVANE_REGISTRY", dir.file("registry.ini").string()};

    Endpoint Resolve(std::u16string_view server, std::u16string_view name = u"N",
                     std::u16string_view serviceClass = u"C")
    {
        Endpoint endpoint;
        EXPECT_EQ(ResolveEndpoint(server, name, serviceClass, endpoint), kResultOk);
        return endpoint;
    }
    std::uint32_t Refusal(std::u16string_view server, std::u16string_view name, std::u16string_view serviceClass)
    {
        Endpoint endpoint;
        return ResolveEndpoint(server, name, serviceClass, endpoint);
    }
};

TEST_F(Resolution, ThisMachineIsReachedThroughTheRuntimeFolder)
{
    for (const char16_t *server : {u"", u"localhost", u"LOCALHOST", u"127.0.0.1", u"127.1.2.3", u"::1", u"[::1]"}) {
        const Endpoint endpoint = Resolve(server, u"VEK_INDEX_SERVICE", u"VEK_INDEX_SERVICE_SEARCH_BROWSE");
        ASSERT_TRUE(std::holds_alternative<UnixEndpoint>(endpoint));
        EXPECT_EQ(std::get<UnixEndpoint>(endpoint).path,
                  dir.path() / "VEK_INDEX_SERVICE_SEARCH_BROWSE" / "VEK_INDEX_SERVICE.sock");
    }
    char host[256] = {};
    ASSERT_EQ(::gethostname(host, sizeof host - 1), 0);
    const std::string name = host;
    EXPECT_TRUE(IsThisMachine(std::u16string(name.begin(), name.end())));
}

TEST_F(Resolution, OtherServersUseTcpAtTheRegisteredPort)
{
    // TEST-NET literals: resolved here, never contacted.
    Endpoint endpoint = Resolve(u"192.0.2.1", u"P1");
    ASSERT_TRUE(std::holds_alternative<TcpEndpoint>(endpoint));
    EXPECT_EQ(std::get<TcpEndpoint>(endpoint).host, "192.0.2.1");
    EXPECT_EQ(std::get<TcpEndpoint>(endpoint).port, kDefaultTcpPort);

    std::ofstream(dir.file("registry.ini")) << "[Software\\Corvane\\Common\\Sorvik\\Services]\np1=17400\nbad=70000\n";
    endpoint = Resolve(u"[2001:db8::1]", u"P1");
    EXPECT_EQ(std::get<TcpEndpoint>(endpoint).host, "2001:db8::1");
    EXPECT_EQ(std::get<TcpEndpoint>(endpoint).port, 17400);
    EXPECT_EQ(Refusal(u"192.0.2.1", u"bad", u"C"), kResultInvalidArgument);
}

TEST_F(Resolution, NamesThatAreNoFileNamesAreRefused)
{
    const std::u16string_view names[] = {u"", u".", u"..", u"../x", u"a/b", std::u16string_view(u"a\0b", 3)};
    for (const std::u16string_view name : names) {
        EXPECT_EQ(Refusal(u"localhost", name, u"C"), kResultInvalidArgument);
        EXPECT_EQ(Refusal(u"localhost", u"N", name), kResultInvalidArgument);
        EXPECT_EQ(Refusal(u"192.0.2.1", name, u"C"), kResultInvalidArgument);
    }
    EXPECT_EQ(Refusal(std::u16string_view(u"127.0.0.1\0x", 11), u"N", u"C"), kResultInvalidArgument);
    EXPECT_EQ(Refusal(u"localhost", std::u16string(200, u'n'), u"C"), kResultInvalidArgument);
}

TEST_F(Resolution, AListenerTakesOverAStaleSocketButNotALiveOne)
{
    std::filesystem::path path;
    {
        Listener first;
        first.ListenLocal(u"N", u"C");
        path = first.UnixPath();
        EXPECT_THROW(Listener().ListenLocal(u"N", u"C"), std::system_error);
    }
    EXPECT_FALSE(std::filesystem::exists(path));

    // A server that died leaves its socket file behind.
    const int orphan = ::socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strcpy(address.sun_path, path.c_str());
    ASSERT_EQ(::bind(orphan, reinterpret_cast<const sockaddr *>(&address), sizeof address), 0);
    ::close(orphan);
    Listener second;
    EXPECT_NO_THROW(second.ListenLocal(u"N", u"C"));
}

TEST(LocalConnectWait, FiveSecondsUnlessTheSettingGivesAnotherWindow)
{
    using std::chrono::milliseconds;
    const std::pair<std::optional<std::string>, milliseconds> rows[] = {
        {std::nullopt, milliseconds(5000)}, {"", milliseconds(5000)},      {"250", milliseconds(250)},
        {"0", milliseconds(0)},             {"60000", milliseconds(60000)}, {"60001", milliseconds(5000)},
        {"-1", milliseconds(5000)},         {"2s", milliseconds(5000)},     {" 250", milliseconds(5000)},
    };
    for (const auto &[setting, window] : rows) {
        testsupport::ScopedEnv env("CORVANE_COMM_CONNECT_WAIT_MS", setting);
        EXPECT_EQ(LocalConnectWait(), window) << setting.value_or("(unset)");
    }
}

TEST_F(Resolution, NobodyListeningLocallyIsTriedForTheWholeWindow)
{
    const Endpoint endpoint = Resolve(u"localhost", u"Nobody", u"C");
    testsupport::ScopedEnv window("CORVANE_COMM_CONNECT_WAIT_MS", "300");
    const auto started = std::chrono::steady_clock::now();
    int fd = -1;
    EXPECT_EQ(ConnectEndpoint(endpoint, fd), kResultUnreachable);
    EXPECT_GE(std::chrono::steady_clock::now() - started, std::chrono::milliseconds(250));
    EXPECT_EQ(fd, -1);
}

TEST(Tcp, CarriesRecordsBothWays)
{
    Listener listener;
    const std::uint16_t port = listener.ListenTcp("127.0.0.1", 0);
    std::uint32_t serverResult = kResultFailure;
    std::thread server([&] {
        const auto connection = listener.Accept(10000);
        if (!connection)
            return;
        ByteBuffer record;
        serverResult = connection->Receive(record, 10000);
        if (serverResult == kResultOk)
            serverResult = connection->Send(record.bytes(), 10000);
    });

    int fd = -1;
    ASSERT_EQ(ConnectEndpoint(TcpEndpoint{"127.0.0.1", port}, fd), kResultOk);
    FramedSocket client(fd);
    const std::vector<std::uint8_t> record = Pattern(3 * 1024 * 1024 + 5);
    EXPECT_EQ(client.Send(record, 10000), kResultOk);
    ByteBuffer echoed;
    EXPECT_EQ(client.Receive(echoed, 10000), kResultOk);
    server.join();
    EXPECT_EQ(serverResult, kResultOk);
    EXPECT_TRUE(std::equal(record.begin(), record.end(), echoed.data(), echoed.data() + echoed.size()));
    EXPECT_EQ(echoed.size(), record.size());
}

TEST(Tcp, NobodyListeningIsUnreachable)
{
    std::uint16_t port = 0;
    {
        Listener probe;
        port = probe.ListenTcp("127.0.0.1", 0);
    }
    int fd = -1;
    EXPECT_EQ(ConnectEndpoint(TcpEndpoint{"127.0.0.1", port}, fd), kResultUnreachable);
    EXPECT_EQ(fd, -1);
}

} // namespace
