#pragma once

// The growable byte buffer that protocol records are serialized into and that
// the comm library fills with one received record. It crosses library
// boundaries by reference, so its layout is fixed: three pointers (first byte,
// one past the last byte, end of the reserved storage). Storage comes from the
// global operator new and goes back to the global operator delete, which all
// parties of one process share.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <new>
#include <span>
#include <type_traits>

namespace cv::krn {

class ByteBuffer
{
public:
    ByteBuffer() noexcept = default;
    ByteBuffer(const void *bytes, std::size_t count) { append(bytes, count); }
    ByteBuffer(const ByteBuffer &other) { append(other.data(), other.size()); }
    ByteBuffer(ByteBuffer &&other) noexcept
        : m_first(other.m_first), m_last(other.m_last), m_end(other.m_end)
    {
        other.m_first = other.m_last = other.m_end = nullptr;
    }
    ByteBuffer &operator=(const ByteBuffer &other)
    {
        if (this != &other) {
            clear();
            append(other.data(), other.size());
        }
        return *this;
    }
    ByteBuffer &operator=(ByteBuffer &&other) noexcept
    {
        if (this != &other) {
            ::operator delete(m_first);
            m_first = other.m_first;
            m_last = other.m_last;
            m_end = other.m_end;
            other.m_first = other.m_last = other.m_end = nullptr;
        }
        return *this;
    }
    ~ByteBuffer() { ::operator delete(m_first); }

    const std::uint8_t *data() const noexcept { return m_first; }
    std::uint8_t *data() noexcept { return m_first; }
    std::size_t size() const noexcept { return std::size_t(m_last - m_first); }
    std::size_t capacity() const noexcept { return std::size_t(m_end - m_first); }
    bool empty() const noexcept { return m_first == m_last; }
    std::span<const std::uint8_t> bytes() const noexcept { return {m_first, size()}; }

    void clear() noexcept { m_last = m_first; }

    void reserve(std::size_t count)
    {
        if (count <= capacity())
            return;
        auto *storage = static_cast<std::uint8_t *>(::operator new(count));
        const std::size_t used = size();
        if (used)
            std::memcpy(storage, m_first, used);
        ::operator delete(m_first);
        m_first = storage;
        m_last = storage + used;
        m_end = storage + count;
    }

    // New bytes are zero.
    void resize(std::size_t count)
    {
        const std::size_t used = size();
        if (count > used) {
            grow(count - used);
            std::memset(m_first + used, 0, count - used);
        }
        m_last = m_first + count;
    }

    void append(const void *bytes, std::size_t count)
    {
        if (count == 0)
            return;
        const auto *source = static_cast<const std::uint8_t *>(bytes);
        const bool inside = m_first && source >= m_first && source < m_last;
        const std::size_t offset = inside ? std::size_t(source - m_first) : 0;
        grow(count);
        if (inside)
            source = m_first + offset;
        std::memmove(m_last, source, count);
        m_last += count;
    }

private:
    void grow(std::size_t extra)
    {
        const std::size_t used = size();
        if (extra > std::size_t(-1) / 2 - used)
            throw std::bad_alloc();
        if (used + extra > capacity())
            reserve(std::max(used + extra, capacity() * 2));
    }

    std::uint8_t *m_first = nullptr;
    std::uint8_t *m_last = nullptr;
    std::uint8_t *m_end = nullptr;
};

static_assert(std::is_standard_layout_v<ByteBuffer>);
static_assert(sizeof(ByteBuffer) == 3 * sizeof(void *));

} // namespace cv::krn
