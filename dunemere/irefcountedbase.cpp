#include "dunemere/irefcountedbase.h"

namespace cv::vek::rovo {

IRefCountedBase::~IRefCountedBase() = default;

std::uint32_t IRefCountedBase::AddRef()
{
    return m_refCount.fetch_add(1, std::memory_order_relaxed) + 1;
}

std::uint32_t IRefCountedBase::Release()
{
    if (m_refCount.fetch_sub(1, std::memory_order_acq_rel) != 1)
        return 1;
    // Back to 1, so that an AddRef/Release pair during destruction cannot
    // delete the object a second time.
    m_refCount.store(1, std::memory_order_relaxed);
    delete this;
    return 0;
}

} // namespace cv::vek::rovo
