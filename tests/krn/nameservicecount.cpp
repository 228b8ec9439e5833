// The test program's own getaddrinfo and getnameinfo come first in the symbol
// search of every library it loads, so each look-up passes through here, is
// counted, and goes on to the C library.

#include "nameservicecount.h"

#include <dlfcn.h>
#include <netdb.h>

#include <atomic>

namespace {

std::atomic<int> g_queries{0};

template <typename Function>
Function Next(const char *name)
{
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

} // namespace

extern "C" __attribute__((visibility("default"))) int getaddrinfo(const char *node, const char *service, const addrinfo *hints, addrinfo **result) noexcept
{
    static const auto next = Next<decltype(&getaddrinfo)>("getaddrinfo");
    ++g_queries;
    return next(node, service, hints, result);
}

extern "C" __attribute__((visibility("default"))) int getnameinfo(const sockaddr *address, socklen_t length, char *host, socklen_t hostLength, char *service,
                           socklen_t serviceLength, int flags) noexcept
{
    static const auto next = Next<decltype(&getnameinfo)>("getnameinfo");
    ++g_queries;
    return next(address, length, host, hostLength, service, serviceLength, flags);
}

namespace krntest {

int NameServiceQueries()
{
    return g_queries.load();
}

} // namespace krntest
