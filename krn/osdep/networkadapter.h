#pragma once

#include <QHostAddress>

#include <cstdint>
#include <vector>

namespace cv::krn::osdep {

// One network adapter as HostInfo needs it: its kind, hardware address and
// unicast addresses.
struct NetworkAdapter
{
    enum class Type
    {
        Ethernet,
        Wireless, // IEEE 802.11
        Other,    // loopback, tunnels, PPP, virtual and anything else
    };

    Type type = Type::Other;
    std::vector<std::uint8_t> hardwareAddress;
    std::vector<QHostAddress> addresses;
};

} // namespace cv::krn::osdep
