#pragma once

#include "dunemere/requesttransferdata.h"
#include "sorvik/bytebuffer.h"

#include <atomic>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace testsupport {

// A protocol peer for client tests: listens on the local service socket of a
// port name (below $CORVANE_RUNTIME_DIR, which the test sets) and answers
// each received request through a script, on its own thread. The script sees
// every request and may answer, answer late, answer for another request,
// drop the connection or stay silent.
class ScriptedServer
{
public:
    struct Request
    {
        std::uint32_t version = 0;
        std::uint32_t category = 0;
        std::uint32_t code = 0;
        GUID id{};
        std::array<std::uint32_t, 4> arguments{};
        std::vector<std::u16string> parameters;
        std::vector<std::uint8_t> token; // authentication steps
        int connection = 0;              // 1 for the first accepted connection
    };

    class Peer
    {
    public:
        virtual void Send(const cv::krn::ByteBuffer &record) = 0;
        virtual void Drop() = 0;

    protected:
        ~Peer() = default;
    };

    using Script = std::function<void(const Request &request, Peer &peer)>;

    ScriptedServer(const std::u16string &portName, Script script);
    ~ScriptedServer();

    std::vector<Request> Received() const;
    int Connections() const { return m_connections.load(); }

    static cv::krn::ByteBuffer Data(const GUID &id, std::int32_t status, std::uint32_t value = 0,
                                    std::u16string text = {});
    static cv::krn::ByteBuffer Authentication(const GUID &id, std::int32_t status,
                                              std::vector<std::uint8_t> token = {});

    // A script for a well-behaved server of the given version: permission
    // granted at exactly that version (otherwise -65535 with the version),
    // and every other request answered with status 0 and answer(request).
    static Script Serving(std::uint32_t version, std::function<std::uint32_t(const Request &)> answer);

private:
    void Run();

    struct Impl;
    std::unique_ptr<Impl> m_impl;
    Script m_script;
    mutable std::mutex m_lock;
    std::vector<Request> m_received;
    std::atomic<int> m_connections{0};
    std::atomic<bool> m_stop{false};
    std::thread m_thread;
};

} // namespace testsupport
