#pragma once

#include "reference/server/serveroptions.h"

#include <atomic>
#include <functional>
#include <memory>

namespace sorvik::server {

class ILogOnAcceptor;

// The reference server: holds its mutexes for its whole life, listens on the
// local service socket of its instance, and serves each connection on a
// thread of its own until asked to stop.
class Server
{
public:
    using AcceptorFactory = std::function<std::unique_ptr<ILogOnAcceptor>()>;

    // Takes the instance mutex (and the global one for the default local
    // server) and starts listening. Raises std::runtime_error with a message
    // for the operator when another server holds them or set-up fails.
    Server(ServerOptions options, AcceptorFactory makeKerberosAcceptor);
    ~Server();

    Server(const Server &) = delete;
    Server &operator=(const Server &) = delete;

    // Serves until stop becomes true; every connection has ended on return.
    void Run(const std::atomic<bool> &stop);

private:
    struct State;
    std::unique_ptr<State> m_state;
};

} // namespace sorvik::server
