#pragma once

#include <atomic>
#include <cstdint>

namespace cv::vek::rovo {

// The module's count of Init calls not yet matched by Cleanup.
class StartCount final
{
public:
    // True for the first start (the count was 0).
    bool Start();
    // True for the last end (the count was 1). An end without a start leaves
    // the count at 0 and returns false: wrapping it would make the next
    // Init skip loading the libraries.
    bool End();
    std::uint32_t Value() const { return m_count.load(); }

private:
    std::atomic<std::uint32_t> m_count{0};
};

} // namespace cv::vek::rovo
