#pragma once

#include <cstdint>

namespace cv::util::file::log {

// What a line reports. The numbers are what sinks and receivers are given.
enum class LineKind : std::uint32_t {
    Info = 0,
    Warning = 1,
    Error = 2,
    FatalError = 3,
};

} // namespace cv::util::file::log
