#pragma once

#include "krn/osdep/ihostnetwork.h"

namespace cv::krn::osdep {

// The network layer of the running system, through QHostInfo and
// QNetworkInterface. Resolving blocks the calling thread.
class QtHostNetwork final : public IHostNetwork
{
public:
    std::u16string LocalHostName() override;
    std::vector<QHostAddress> Resolve(std::u16string_view host) override;
    std::optional<std::vector<NetworkAdapter>> Adapters() override;
};

} // namespace cv::krn::osdep
