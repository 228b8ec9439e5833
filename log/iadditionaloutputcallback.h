#pragma once

#include <cstdint>

namespace cv::util::file::log {

// Turns the additional-output receiver of a log on and off.
class IAdditionalOutputCallBack
{
public:
    // Sets kOutputAdditionalSwitch and replaces the info mask with mask.
    virtual void SwitchOn(std::uint32_t mask) = 0;
    // Clears kOutputAdditionalSwitch and sets the info mask to 0.
    virtual void SwitchOff() = 0;

protected:
    ~IAdditionalOutputCallBack() = default;
};

} // namespace cv::util::file::log
