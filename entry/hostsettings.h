#pragma once

#include "sorvik/logfont.h"
#include "sorvik/serverdialogs.h"

#include <cstdint>

namespace cv::vek::rovo {

// What the host set on a service object and every dialog receives.
struct HostSettings
{
    SorvikHelpCallback helpCallback = nullptr; // null: no help offered
    std::uintptr_t helpContext = 0;
    LOGFONTW font{};
    bool fontSet = false; // until the host sets a font, dialogs keep their template's
    std::int32_t waitFlag = 1;
};

} // namespace cv::vek::rovo
