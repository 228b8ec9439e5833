#pragma once

namespace krntest {

// How many look-ups this process has asked of the name service so far
// (getaddrinfo and getnameinfo calls from any library).
int NameServiceQueries();

} // namespace krntest
