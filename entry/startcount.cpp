#include "entry/startcount.h"

namespace cv::vek::rovo {

bool StartCount::Start()
{
    return m_count.fetch_add(1) == 0;
}

bool StartCount::End()
{
    std::uint32_t count = m_count.load();
    do {
        if (count == 0)
            return false;
    } while (!m_count.compare_exchange_weak(count, count - 1));
    return count == 1;
}

} // namespace cv::vek::rovo
