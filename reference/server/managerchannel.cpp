#include "reference/server/managerchannel.h"

#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "reference/server/managerrequests.h"
#include "sorvik/rovoapi.h"
#include "sorvik/rovocomm.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>

namespace sorvik::server {

namespace {

namespace comm = cv::vek::rovo::comm;

// How often the accepting thread looks at the stop flag.
constexpr std::uint32_t kAcceptPollMs = 100;
// A request that has begun to arrive must be complete within this time, and
// an answer taken within it.
constexpr std::uint32_t kTransferMs = 5000;

bool SameUser(int fd)
{
    ucred peer{};
    socklen_t size = sizeof peer;
    if (::getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0)
        return false;
    return peer.uid == ::geteuid() || peer.uid == 0;
}

// True when input arrived, false when the server stops.
bool WaitForInput(int socket, int stop)
{
    pollfd waits[2] = {{socket, POLLIN, 0}, {stop, POLLIN, 0}};
    while (::poll(waits, 2, -1) < 0) {
        if (errno != EINTR)
            return false;
    }
    return waits[1].revents == 0;
}

} // namespace

struct ManagerChannel::Connection
{
    std::unique_ptr<comm::FramedSocket> socket;
    std::thread thread;
    std::atomic<bool> done{false};
};

ManagerChannel::ManagerChannel(std::u16string_view portName, ManagerRequests &requests) : m_requests(requests)
{
    m_stop = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (m_stop < 0)
        throw std::runtime_error("cannot create an event");
    if (portName.empty())
        m_listener.ListenLocal(manager::kLocalName, manager::kLocalClass);
    else
        m_listener.ListenLocal(portName, manager::kInstanceClass);
}

ManagerChannel::~ManagerChannel()
{
    Stop();
    ::close(m_stop);
}

void ManagerChannel::Start()
{
    m_thread = std::thread([this] { Accept(); });
}

void ManagerChannel::Stop()
{
    if (!m_thread.joinable())
        return;
    m_stopping.store(true);
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t written = ::write(m_stop, &one, sizeof one);
    m_thread.join();
}

void ManagerChannel::Accept()
{
    std::list<Connection> connections;
    auto reapFinished = [&connections] {
        for (auto it = connections.begin(); it != connections.end();) {
            if (it->done.load()) {
                it->thread.join();
                it = connections.erase(it);
            } else {
                ++it;
            }
        }
    };
    while (!m_stopping.load()) {
        auto socket = m_listener.Accept(kAcceptPollMs);
        reapFinished();
        if (!socket)
            continue;
        Connection &connection = connections.emplace_back();
        connection.socket = std::move(socket);
        connection.thread = std::thread([this, &connection] {
            try {
                Serve(connection);
            } catch (const std::exception &) {
                // Out of memory or no event for a wait: this client loses
                // its connection, the others keep theirs.
            }
            connection.socket->Close();
            connection.done.store(true);
        });
    }
    for (Connection &connection : connections)
        connection.thread.join();
}

void ManagerChannel::Serve(Connection &connection)
{
    comm::FramedSocket &socket = *connection.socket;
    if (!SameUser(socket.Descriptor())) {
        const auto refusal = manager::EncodeMessage(
            manager::Answer(cv::rovo::status::NotAllowed, QStringLiteral("the server serves only its own user")));
        socket.Send(refusal.bytes(), kTransferMs);
        return;
    }
    cv::krn::ByteBuffer record;
    while (WaitForInput(socket.Descriptor(), m_stop)) {
        if (socket.Receive(record, kTransferMs) != comm::kResultOk)
            return;
        // A frame that is not a request leaves the stream in step: say so and go on.
        const auto request = manager::DecodeMessage(record.bytes(), manager::kMaxRequestBytes);
        const int cancel[] = {socket.Descriptor(), m_stop};
        std::optional<QJsonObject> answer;
        if (request)
            answer = m_requests.Handle(*request, cancel);
        else
            answer = manager::Answer(cv::rovo::status::InvalidArgument,
                                     QStringLiteral("a request is a JSON object of at most 1 MiB"));
        if (!answer)
            return;
        if (socket.Send(manager::EncodeMessage(*answer).bytes(), kTransferMs) != comm::kResultOk)
            return;
    }
}

} // namespace sorvik::server
