#include "support/scriptedserver.h"

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "reference/comm/listener.h"
#include "sorvik/rovocomm.h"

namespace testsupport {

namespace {

using cv::krn::ByteBuffer;
using namespace cv::vek::rovo;

std::uint32_t Word(const std::uint8_t *bytes)
{
    return std::uint32_t(bytes[0]) | std::uint32_t(bytes[1]) << 8 | std::uint32_t(bytes[2]) << 16 |
           std::uint32_t(bytes[3]) << 24;
}

ScriptedServer::Request Parse(const ByteBuffer &bytes, int connection)
{
    ScriptedServer::Request request;
    request.connection = connection;
    std::size_t position = 0;
    if (bytes.size() >= 20 && Word(bytes.data() + 12) == 4 && Word(bytes.data() + 16) == 3002) {
        CAuthenticationRequestTransferData record;
        record.Deserialize(bytes, position);
        request.version = record.Version();
        request.category = record.Category();
        request.code = record.Code();
        request.id = record.RequestIdentifier();
        request.token = record.Token();
        return request;
    }
    tRequestTransferData record;
    record.Deserialize(bytes, position);
    request.version = record.Version();
    request.category = record.Category();
    request.code = record.Code();
    request.id = record.RequestIdentifier();
    request.arguments = record.Arguments();
    request.parameters = record.Parameters();
    return request;
}

class SocketPeer final : public ScriptedServer::Peer
{
public:
    explicit SocketPeer(comm::FramedSocket &socket) : m_socket(socket) {}
    void Send(const ByteBuffer &record) override { m_socket.Send(record.bytes(), 5000); }
    void Drop() override { m_socket.Close(); }

private:
    comm::FramedSocket &m_socket;
};

} // namespace

struct ScriptedServer::Impl
{
    comm::Listener listener;
};

ScriptedServer::ScriptedServer(const std::u16string &portName, Script script)
    : m_impl(std::make_unique<Impl>()), m_script(std::move(script))
{
    if (portName.empty())
        m_impl->listener.ListenLocal(u"VEK_INDEX_SERVICE", u"VEK_INDEX_SERVICE_SEARCH_BROWSE");
    else
        m_impl->listener.ListenLocal(portName, u"VEK_INDEX_SERVICE_SERVER");
    m_thread = std::thread([this] { Run(); });
}

ScriptedServer::~ScriptedServer()
{
    m_stop.store(true);
    m_thread.join();
}

std::vector<ScriptedServer::Request> ScriptedServer::Received() const
{
    std::lock_guard lock(m_lock);
    return m_received;
}

// One connection at a time, as the requestor makes them.
void ScriptedServer::Run()
{
    while (!m_stop.load()) {
        auto socket = m_impl->listener.Accept(50);
        if (!socket)
            continue;
        const int connection = ++m_connections;
        SocketPeer peer(*socket);
        ByteBuffer bytes;
        while (!m_stop.load() && socket->IsOpen()) {
            const std::uint32_t result = socket->Receive(bytes, 50);
            if (result == comm::kResultTimeout)
                continue;
            if (result != comm::kResultOk)
                break;
            Request request = Parse(bytes, connection);
            {
                std::lock_guard lock(m_lock);
                m_received.push_back(request);
            }
            m_script(request, peer);
        }
    }
}

ByteBuffer ScriptedServer::Data(const GUID &id, std::int32_t status, std::uint32_t value, std::u16string text)
{
    ByteBuffer out;
    tResponseTransferData(id, status, value, std::move(text)).Serialize(out);
    return out;
}

ByteBuffer ScriptedServer::Authentication(const GUID &id, std::int32_t status, std::vector<std::uint8_t> token)
{
    ByteBuffer out;
    tResponseTransferAuthentication(id, status, token).Serialize(out);
    return out;
}

ScriptedServer::Script ScriptedServer::Serving(std::uint32_t version,
                                               std::function<std::uint32_t(const Request &)> answer)
{
    return [version, answer = std::move(answer)](const Request &request, Peer &peer) {
        if (request.category == 4 && request.code == 3001) {
            if (request.version == version)
                peer.Send(Data(request.id, 0));
            else
                peer.Send(Data(request.id, -65535, version));
            return;
        }
        peer.Send(Data(request.id, 0, answer(request)));
    };
}

} // namespace testsupport
