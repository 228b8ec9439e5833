// Sorvik: the reference server process. See README.md for its command line.

#include "reference/server/kerberoslogon.h"
#include "reference/server/server.h"
#include "reference/server/serveroptions.h"


#include <atomic>
#include <csignal>
#include <cstdio>
#include <exception>

namespace {

std::atomic<bool> g_stop{false};

extern "C" void RequestStop(int)
{
    g_stop.store(true);
}

} // namespace

int main(int argc, char **argv)
{
    std::string error;
    const auto options = sorvik::server::ParseServerOptions(argc, argv, error);
    if (!options) {
        std::fprintf(stderr, "Sorvik: %s\n", error.c_str());
        return 2;
    }
    if (!options->store.empty())
        ::setenv("CORVANE_SORVIK_STORE", options->store.c_str(), 1);

    struct sigaction action{};
    action.sa_handler = RequestStop;
    sigemptyset(&action.sa_mask);
    ::sigaction(SIGTERM, &action, nullptr);
    ::sigaction(SIGINT, &action, nullptr);
    ::signal(SIGPIPE, SIG_IGN);

    try {
        sorvik::server::Server server(*options, sorvik::server::KerberosAcceptorFactory(*options));
        server.Run(g_stop);
    } catch (const std::exception &failure) {
        std::fprintf(stderr, "Sorvik: %s\n", failure.what());
        return 1;
    }
    return 0;
}
