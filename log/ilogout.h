#pragma once

#include "log/ilogline.h"

#include <string_view>
#include <type_traits>
#include <utility>

namespace cv::util::file::log {

// A handle to a line being assembled: it owns one reference to the line, or
// none when the log filtered the line out. Appends through an empty handle do
// nothing, so a filtered line costs no more than the test that filtered it.
//
//     log.Info(__FILE__, __LINE__, 3) << "SKCP: connected " << count;
//
// The line is written when the last handle to it goes, here at the end of the
// statement.
class ILogOut final
{
public:
    ILogOut() noexcept = default;
    // Takes over a reference the caller holds.
    explicit ILogOut(ILogLine *line) noexcept : m_line(line) {}
    ILogOut(const ILogOut &other) noexcept : m_line(other.m_line)
    {
        if (m_line)
            m_line->AddRef();
    }
    ILogOut(ILogOut &&other) noexcept : m_line(std::exchange(other.m_line, nullptr)) {}
    ILogOut &operator=(ILogOut other) noexcept
    {
        std::swap(m_line, other.m_line);
        return *this;
    }
    // A destructor must not throw: a line whose writing fails is dropped.
    ~ILogOut()
    {
        if (m_line)
            Drop();
    }

    // False when the line was filtered out.
    explicit operator bool() const noexcept { return m_line != nullptr; }

    // Numbers in decimal; floating values as "%g". Plain characters are text.
    template <typename T>
        requires(std::is_arithmetic_v<T> && !std::is_same_v<T, long double>)
    ILogOut &operator<<(T value)
    {
        if (m_line)
            m_line->Append(value);
        return *this;
    }
    ILogOut &operator<<(char character)
    {
        if (m_line)
            m_line->Append(std::string_view(&character, 1));
        return *this;
    }
    ILogOut &operator<<(char16_t character)
    {
        if (m_line)
            m_line->Append(std::u16string_view(&character, 1));
        return *this;
    }
    // UTF-8 text; a null pointer appends nothing.
    ILogOut &operator<<(const char *utf8)
    {
        if (m_line && utf8)
            m_line->Append(std::string_view(utf8));
        return *this;
    }
    ILogOut &operator<<(std::string_view utf8)
    {
        if (m_line)
            m_line->Append(utf8);
        return *this;
    }
    ILogOut &operator<<(const char16_t *text)
    {
        if (m_line && text)
            m_line->Append(std::u16string_view(text));
        return *this;
    }
    ILogOut &operator<<(std::u16string_view text)
    {
        if (m_line)
            m_line->Append(text);
        return *this;
    }

    // printf-style appends with the line's rules (see ILogLine::AppendFormat).
    ILogOut &Format(const char *format, ...) __attribute__((format(printf, 2, 3)));
    ILogOut &FormatLine(const char *format, ...) __attribute__((format(printf, 2, 3)));

private:
    void Drop() noexcept;

    ILogLine *m_line = nullptr;
};

} // namespace cv::util::file::log
