#pragma once

#include "sharedsource/hostsettings.h"

#include <cstdint>

namespace cv::vek::rovo {

// What the host set on a service object and every dialog receives: the
// font and help every window gets, and whether a dialog waits for the
// server after its commit.
struct HostSettings
{
    sharedsource::HostSettings window;
    std::int32_t waitFlag = 1;
};

} // namespace cv::vek::rovo
