#pragma once

// The reference counting every fake server object of the tests needs:
// AddRef and Release for Interface, the object deleting itself at zero.

#include <atomic>
#include <cstdint>

namespace testsupport {

template <typename Interface>
class RefCountedFake : public Interface
{
public:
    std::uint32_t AddRef() override { return ++m_refs; }
    std::uint32_t Release() override
    {
        const std::uint32_t left = --m_refs;
        if (left == 0)
            delete this;
        return left;
    }
    std::uint32_t References() const { return m_refs.load(); }

protected:
    RefCountedFake() = default;
    virtual ~RefCountedFake() = default;

private:
    std::atomic<std::uint32_t> m_refs{1};
};

} // namespace testsupport
