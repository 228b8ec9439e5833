#include "log/ilogout.h"

#include "log/logtext.h"

namespace cv::util::file::log {

ILogOut &ILogOut::Format(const char *format, ...)
{
    if (!m_line || !format)
        return *this;
    char buffer[text::kFormatBufferSize];
    std::va_list args;
    va_start(args, format);
    const std::size_t length = text::FormatPrintf(buffer, format, args);
    va_end(args);
    m_line->Append(std::string_view(buffer, length));
    return *this;
}

ILogOut &ILogOut::FormatLine(const char *format, ...)
{
    if (!m_line || !format)
        return *this;
    char buffer[text::kFormatBufferSize];
    std::va_list args;
    va_start(args, format);
    const std::size_t length = text::FormatPrintf(buffer, format, args);
    va_end(args);
    buffer[length] = '\0';
    // Through the line, so the line end is the one of the line's log.
    m_line->AppendFormatLine("%s", buffer);
    return *this;
}

void ILogOut::Drop() noexcept
{
    try {
        m_line->Release();
    } catch (...) {
        // A destructor cannot report it; the line is lost, the program goes on.
    }
    m_line = nullptr;
}

} // namespace cv::util::file::log
