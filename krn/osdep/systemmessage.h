#pragma once

#include <cstdint>
#include <string>

namespace cv::krn::osdep {

// The platform's text for an error number (strerror_r), never empty.
std::string SystemMessage(std::uint32_t errorNumber);

} // namespace cv::krn::osdep
