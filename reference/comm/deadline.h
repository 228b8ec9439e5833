#pragma once

#include "sorvik/rovocomm.h"

#include <chrono>
#include <cstdint>

namespace cv::vek::rovo::comm {

// The end of a time-out in milliseconds, for poll(2): kInfinite never ends.
class Deadline final
{
public:
    explicit Deadline(std::uint32_t timeoutMs)
        : m_infinite(timeoutMs == kInfinite),
          m_end(std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs))
    {
    }

    // What is left, rounded up so that a wait never ends early; -1 without limit.
    int RemainingMs() const
    {
        if (m_infinite)
            return -1;
        const auto left = m_end - std::chrono::steady_clock::now();
        if (left <= std::chrono::steady_clock::duration::zero())
            return 0;
        const auto ms = std::chrono::ceil<std::chrono::milliseconds>(left).count();
        return ms > 0x7FFFFFFF ? 0x7FFFFFFF : static_cast<int>(ms);
    }

    bool Passed() const { return !m_infinite && std::chrono::steady_clock::now() >= m_end; }

private:
    bool m_infinite;
    std::chrono::steady_clock::time_point m_end;
};

} // namespace cv::vek::rovo::comm
