#pragma once

#include "krn/osdep/networkadapter.h"

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace cv::krn::osdep {

// What HostInfo asks of the network layer; tests supply their own.
class IHostNetwork
{
public:
    virtual ~IHostNetwork() = default;

    // The name this machine gives itself.
    virtual std::u16string LocalHostName() = 0;

    // The addresses of a host name or address text; raises
    // NotResolvedException when there are none.
    virtual std::vector<QHostAddress> Resolve(std::u16string_view host) = 0;

    // Every adapter with its addresses; nothing when the query failed.
    virtual std::optional<std::vector<NetworkAdapter>> Adapters() = 0;
};

} // namespace cv::krn::osdep
