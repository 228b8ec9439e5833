#pragma once

#include <cstdint>
#include <string_view>

namespace cv::util::file::log {

// One line being assembled. It is reference counted; the line is handed to its
// log when the last reference is released. Callers normally go through ILogOut.
class ILogLine
{
protected:
    virtual ~ILogLine() = default;

public:
    virtual void Append(long long value) = 0;
    virtual void Append(unsigned long long value) = 0;
    virtual void Append(unsigned char value) = 0;
    virtual void Append(unsigned short value) = 0;
    virtual void Append(unsigned int value) = 0;
    virtual void Append(unsigned long value) = 0;
    virtual void Append(signed char value) = 0;
    virtual void Append(short value) = 0;
    virtual void Append(int value) = 0;
    virtual void Append(long value) = 0;
    // Both as printf's "%g": six significant digits.
    virtual void Append(float value) = 0;
    virtual void Append(double value) = 0;
    // UTF-8 text, converted to UTF-16.
    virtual void Append(std::string_view utf8) = 0;
    virtual void Append(std::u16string_view text) = 0;
    // printf-style with a UTF-8 format. The result is cut to 2047 bytes (never
    // inside a UTF-8 sequence); a null format appends nothing.
    virtual void AppendFormat(const char *format, ...) __attribute__((format(printf, 2, 3))) = 0;
    // As AppendFormat, followed by the log's line end.
    virtual void AppendFormatLine(const char *format, ...) __attribute__((format(printf, 2, 3))) = 0;
    virtual std::uint32_t AddRef() noexcept = 0;
    // Returns the references left. Releasing the last one writes the line and
    // deletes the object; errors of the write propagate after the deletion.
    virtual std::uint32_t Release() = 0;

    ILogLine(const ILogLine &) = delete;
    ILogLine &operator=(const ILogLine &) = delete;

protected:
    ILogLine() = default;
};

} // namespace cv::util::file::log
