#pragma once

// The foundation wide string: UTF-16 text held as exactly three pointers (first
// character, one past the last character, end of the reserved storage). It is
// the text type of every interface between the module, its hosts and the
// product libraries, so its layout is fixed; storage comes from the global
// operator new and goes back to the global operator delete, which all parties
// of one process share. The characters are always followed by a NUL, which the
// reserved storage does not count.

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <new>
#include <string>
#include <string_view>
#include <type_traits>

namespace cv::krn {

class WString
{
public:
    WString() noexcept = default;
    WString(const char16_t *text) { assign(text ? std::u16string_view(text) : std::u16string_view()); }
    WString(const char16_t *text, std::size_t length) { assign(std::u16string_view(text, length)); }
    explicit WString(std::u16string_view text) { assign(text); }
    explicit WString(const std::u16string &text) { assign(text); }

    WString(const WString &other) { assign(other.view()); }
    WString(WString &&other) noexcept
        : m_first(other.m_first), m_last(other.m_last), m_end(other.m_end)
    {
        other.m_first = other.m_last = other.m_end = nullptr;
    }
    WString &operator=(const WString &other)
    {
        if (this != &other)
            assign(other.view());
        return *this;
    }
    WString &operator=(WString &&other) noexcept
    {
        if (this != &other) {
            release();
            m_first = other.m_first;
            m_last = other.m_last;
            m_end = other.m_end;
            other.m_first = other.m_last = other.m_end = nullptr;
        }
        return *this;
    }
    WString &operator=(std::u16string_view text)
    {
        assign(text);
        return *this;
    }
    WString &operator=(const char16_t *text)
    {
        assign(text ? std::u16string_view(text) : std::u16string_view());
        return *this;
    }
    ~WString() { release(); }

    bool empty() const noexcept { return m_first == m_last; }
    std::size_t size() const noexcept { return std::size_t(m_last - m_first); }
    std::size_t capacity() const noexcept { return std::size_t(m_end - m_first); }

    // Never null: an empty string without storage yields a static empty text.
    const char16_t *c_str() const noexcept { return m_first ? m_first : u""; }
    const char16_t *data() const noexcept { return c_str(); }
    const char16_t *begin() const noexcept { return c_str(); }
    const char16_t *end() const noexcept { return c_str() + size(); }
    char16_t operator[](std::size_t index) const noexcept { return m_first[index]; }

    std::u16string_view view() const noexcept { return {c_str(), size()}; }
    operator std::u16string_view() const noexcept { return view(); }
    std::u16string toU16String() const { return std::u16string(view()); }

    void clear() noexcept
    {
        m_last = m_first;
        if (m_first)
            *m_last = u'\0';
    }

    void reserve(std::size_t characters)
    {
        if (characters <= capacity())
            return;
        char16_t *storage = allocate(characters);
        const std::size_t length = size();
        if (length)
            std::memcpy(storage, m_first, length * sizeof(char16_t));
        storage[length] = u'\0';
        release();
        m_first = storage;
        m_last = storage + length;
        m_end = storage + characters;
    }

    void assign(std::u16string_view text)
    {
        if (text.size() > capacity() || overlaps(text)) {
            WString copy;
            copy.reserve(text.size());
            copy.append(text);
            *this = std::move(copy);
            return;
        }
        clear();
        append(text);
    }

    WString &append(std::u16string_view text)
    {
        if (text.empty())
            return *this;
        const std::size_t length = size();
        if (length + text.size() > capacity()) {
            if (overlaps(text)) {
                const std::u16string copy(text);
                return append(copy);
            }
            reserve(std::max(length + text.size(), capacity() * 2));
        }
        std::memmove(m_first + length, text.data(), text.size() * sizeof(char16_t));
        m_last = m_first + length + text.size();
        *m_last = u'\0';
        return *this;
    }
    WString &operator+=(std::u16string_view text) { return append(text); }
    WString &operator+=(char16_t c) { return append(std::u16string_view(&c, 1)); }

    friend bool operator==(const WString &a, const WString &b) noexcept { return a.view() == b.view(); }
    friend bool operator==(const WString &a, std::u16string_view b) noexcept { return a.view() == b; }
    friend bool operator==(const WString &a, const char16_t *b) noexcept
    {
        return a.view() == std::u16string_view(b ? b : u"");
    }

private:
    static char16_t *allocate(std::size_t characters)
    {
        if (characters >= std::size_t(-1) / sizeof(char16_t) - 1)
            throw std::bad_alloc();
        return static_cast<char16_t *>(::operator new((characters + 1) * sizeof(char16_t)));
    }

    bool overlaps(std::u16string_view text) const noexcept
    {
        return m_first && text.data() >= m_first && text.data() < m_end + 1;
    }

    void release() noexcept
    {
        ::operator delete(m_first);
        m_first = m_last = m_end = nullptr;
    }

    char16_t *m_first = nullptr;
    char16_t *m_last = nullptr;
    char16_t *m_end = nullptr;
};

static_assert(std::is_standard_layout_v<WString>);
static_assert(sizeof(WString) == 3 * sizeof(char16_t *));

inline WString operator+(WString a, std::u16string_view b)
{
    a.append(b);
    return a;
}

} // namespace cv::krn
