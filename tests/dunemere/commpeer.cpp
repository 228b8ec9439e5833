// A helper process for the comm tests.
//
//   commpeer serve NAME CLASS BEHAVIOUR   listens on the local service, prints
//                                         "ready", serves one connection
//   commpeer connect SERVER NAME CLASS    connects through the comm library
//                                         found in the registry, prints
//                                         "connected" or the error's code and
//                                         message
//
// Behaviours: echo (sends every record back), silent (never answers), die
// (after one record sends half a frame and exits), oversize (after one
// record announces a frame above the limit, then reports "closed" once the
// client has dropped the connection).

#include "dunemere/rovocommclient.h"
#include "dunemere/tointmsgda.h"
#include "krn/utf.h"
#include "reference/comm/listener.h"
#include "sorvik/rovocomm.h"

#include <cstdio>
#include <cstring>
#include <poll.h>
#include <string>
#include <sys/socket.h>
#include <unistd.h>

namespace {

namespace comm = cv::vek::rovo::comm;

constexpr std::uint32_t kWaitMs = 20000;

void Say(const std::string &line)
{
    std::printf("%s\n", line.c_str());
    std::fflush(stdout);
}

void SendRaw(int fd, std::uint32_t announced, std::size_t bodyBytes)
{
    std::string frame(4 + bodyBytes, 'x');
    for (int i = 0; i < 4; ++i)
        frame[i] = static_cast<char>(announced >> (8 * i));
    ::send(fd, frame.data(), frame.size(), MSG_NOSIGNAL);
}

void WaitForHangUp(int fd)
{
    char scratch[4096];
    for (;;) {
        pollfd entry{fd, POLLIN, 0};
        if (::poll(&entry, 1, kWaitMs) <= 0)
            return;
        if (::recv(fd, scratch, sizeof scratch, 0) <= 0)
            return;
    }
}

int Serve(const std::string &name, const std::string &serviceClass, const std::string &behaviour)
{
    comm::Listener listener;
    listener.ListenLocal(cv::krn::ToUtf16(name), cv::krn::ToUtf16(serviceClass));
    Say("ready");
    const auto connection = listener.Accept(kWaitMs);
    if (!connection)
        return 2;

    cv::krn::ByteBuffer record;
    if (behaviour == "echo") {
        while (connection->Receive(record, kWaitMs) == comm::kResultOk) {
            if (connection->Send(record.bytes(), kWaitMs) != comm::kResultOk)
                return 3;
        }
        return 0;
    }
    if (behaviour == "silent") {
        WaitForHangUp(connection->Descriptor());
        return 0;
    }
    if (connection->Receive(record, kWaitMs) != comm::kResultOk)
        return 3;
    if (behaviour == "die") {
        SendRaw(connection->Descriptor(), 100, 10);
        ::_exit(0);
    }
    if (behaviour == "oversize") {
        SendRaw(connection->Descriptor(), comm::kMaxFrameBytes + 1, 64);
        WaitForHangUp(connection->Descriptor());
        Say("closed");
        return 0;
    }
    return 4;
}

int Connect(const std::string &server, const std::string &name, const std::string &serviceClass)
{
    try {
        const auto client = PLUGIN::rovoCommClient::Create(cv::krn::WString(cv::krn::ToUtf16(server)),
                                                           cv::krn::WString(cv::krn::ToUtf16(name)),
                                                           cv::krn::WString(cv::krn::ToUtf16(serviceClass)));
        Say("connected");
    } catch (const DataCache::ToIntMsgDa &error) {
        Say(std::to_string(error.Code()));
        Say(cv::krn::ToUtf8(error.Message()));
    }
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    if (argc == 5 && std::strcmp(argv[1], "serve") == 0)
        return Serve(argv[2], argv[3], argv[4]);
    if (argc == 5 && std::strcmp(argv[1], "connect") == 0)
        return Connect(argv[2], argv[3], argv[4]);
    std::fprintf(stderr, "usage: commpeer serve NAME CLASS BEHAVIOUR | connect SERVER NAME CLASS\n");
    return 64;
}
