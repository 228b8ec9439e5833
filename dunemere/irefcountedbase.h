#pragma once

#include <atomic>
#include <cstdint>

namespace cv::vek::rovo {

// Reference counting for the log-on clients. Objects live on the heap and
// start with one reference, held by their creator.
class IRefCountedBase
{
public:
    IRefCountedBase() = default;
    IRefCountedBase(const IRefCountedBase &) = delete;
    IRefCountedBase &operator=(const IRefCountedBase &) = delete;
    virtual ~IRefCountedBase();

    // Returns the new count.
    virtual std::uint32_t AddRef();
    // Returns 0 when this released the last reference and the object is gone,
    // 1 otherwise.
    virtual std::uint32_t Release();

private:
    std::atomic<std::uint32_t> m_refCount{1};
};

} // namespace cv::vek::rovo
