#pragma once

#include "reference/comm/listener.h"

#include <atomic>
#include <list>
#include <memory>
#include <string_view>
#include <thread>

namespace sorvik::server {

class ManagerRequests;

// The server's end of the manager channel: listens on the instance's
// manager socket (reference/managerchannel) and serves each connection on a
// thread of its own. Only processes of the server's own user (or root) are
// served; any other gets NotAllowed.
class ManagerChannel
{
public:
    // Listens at once. Raises std::system_error.
    ManagerChannel(std::u16string_view portName, ManagerRequests &requests);
    ~ManagerChannel();

    ManagerChannel(const ManagerChannel &) = delete;
    ManagerChannel &operator=(const ManagerChannel &) = delete;

    void Start();
    // Ends every connection, a waiting one too, and stops accepting.
    void Stop();

private:
    struct Connection;
    void Accept();
    void Serve(Connection &connection);

    ManagerRequests &m_requests;
    cv::vek::rovo::comm::Listener m_listener;
    int m_stop = -1; // eventfd, readable once stopping
    std::atomic<bool> m_stopping{false};
    std::thread m_thread;
};

} // namespace sorvik::server
