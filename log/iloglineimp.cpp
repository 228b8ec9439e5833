#include "log/iloglineimp.h"

#include "log/logtext.h"

#include <utility>

namespace cv::util::file::log {

ILogLineImp::ILogLineImp(ILogGlob &glob, LineKind kind, std::uint32_t verbosity, std::u16string text)
    : m_glob(glob), m_text(std::move(text)), m_kind(kind), m_verbosity(verbosity)
{
}

ILogLineImp::~ILogLineImp() = default;

void ILogLineImp::Append(long long value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(unsigned long long value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(unsigned char value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(unsigned short value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(unsigned int value) { text::AppendDecimal(m_text, value); }
// Full width: long is 64 bits here, and cutting it to 32 would print wrong numbers.
void ILogLineImp::Append(unsigned long value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(signed char value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(short value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(int value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(long value) { text::AppendDecimal(m_text, value); }
void ILogLineImp::Append(float value) { text::AppendGeneral(m_text, value); }
void ILogLineImp::Append(double value) { text::AppendGeneral(m_text, value); }
void ILogLineImp::Append(std::string_view utf8) { text::AppendUtf8(m_text, utf8); }
void ILogLineImp::Append(std::u16string_view text) { m_text.append(text); }

void ILogLineImp::AppendFormat(const char *format, ...)
{
    if (!format)
        return;
    std::va_list args;
    va_start(args, format);
    AppendFormatted(format, args);
    va_end(args);
}

void ILogLineImp::AppendFormatLine(const char *format, ...)
{
    if (!format)
        return;
    std::va_list args;
    va_start(args, format);
    AppendFormatted(format, args);
    va_end(args);
    m_text.append(m_glob.LineEnd());
}

void ILogLineImp::AppendFormatted(const char *format, std::va_list args)
{
    char buffer[text::kFormatBufferSize];
    const std::size_t length = text::FormatPrintf(buffer, format, args);
    text::AppendUtf8(m_text, std::string_view(buffer, length));
}

std::uint32_t ILogLineImp::AddRef() noexcept
{
    return m_refCount.fetch_add(1, std::memory_order_relaxed) + 1;
}

std::uint32_t ILogLineImp::Release()
{
    const std::uint32_t left = m_refCount.fetch_sub(1, std::memory_order_acq_rel) - 1;
    if (left != 0)
        return left;
    try {
        if (!m_text.empty())
            m_glob.WriteLine(m_text, m_kind, m_verbosity);
    } catch (...) {
        delete this;
        throw;
    }
    delete this;
    return 0;
}

} // namespace cv::util::file::log
