#pragma once

// Reference counting shared by the product libraries' objects. Every object a
// library hands out carries one reference for the receiver; whoever stores one
// takes a reference and releases it when done. The object deletes itself inside
// its own library when the last reference goes, so no party frees another's
// memory.

#include "sorvik/com.h"

#include <cstdint>
#include <utility>

namespace cv::krn {

struct SORVIK_EXPORT IRefCounted
{
    // Both return the new count; at 0 the object no longer exists.
    virtual std::uint32_t AddRef() = 0;
    virtual std::uint32_t Release() = 0;

protected:
    ~IRefCounted() = default;
};

// Owns one reference to T (IRefCounted or IUnknown alike: only AddRef and
// Release by name are used).
template <typename T>
class RefPtr
{
public:
    RefPtr() noexcept = default;
    RefPtr(std::nullptr_t) noexcept {}
    RefPtr(const RefPtr &other) noexcept : m_ptr(other.m_ptr)
    {
        if (m_ptr)
            m_ptr->AddRef();
    }
    RefPtr(RefPtr &&other) noexcept : m_ptr(std::exchange(other.m_ptr, nullptr)) {}
    RefPtr &operator=(RefPtr other) noexcept
    {
        std::swap(m_ptr, other.m_ptr);
        return *this;
    }
    ~RefPtr()
    {
        if (m_ptr)
            m_ptr->Release();
    }

    // Takes over the reference the caller already holds (a library result).
    static RefPtr Adopt(T *ptr) noexcept
    {
        RefPtr result;
        result.m_ptr = ptr;
        return result;
    }
    // Takes a reference of its own.
    static RefPtr Share(T *ptr) noexcept
    {
        if (ptr)
            ptr->AddRef();
        return Adopt(ptr);
    }

    T *get() const noexcept { return m_ptr; }
    T *operator->() const noexcept { return m_ptr; }
    T &operator*() const noexcept { return *m_ptr; }
    explicit operator bool() const noexcept { return m_ptr != nullptr; }

    // Hands the reference to the caller, e.g. as a library result.
    T *Detach() noexcept { return std::exchange(m_ptr, nullptr); }
    void Reset() noexcept { RefPtr().swap(*this); }
    void swap(RefPtr &other) noexcept { std::swap(m_ptr, other.m_ptr); }

private:
    T *m_ptr = nullptr;
};

} // namespace cv::krn
