#pragma once

#include "log/ilogglob.h"
#include "log/ilogline.h"

#include <atomic>
#include <cstdarg>
#include <cstdint>
#include <string>

namespace cv::util::file::log {

// A line of a log: its text grows with each append and goes to its sink when
// the last reference is released. Created on the heap with one reference.
class ILogLineImp final : public ILogLine
{
    ~ILogLineImp() override;

public:
    ILogLineImp(ILogGlob &glob, LineKind kind, std::uint32_t verbosity, std::u16string text = {});

    void Append(long long value) override;
    void Append(unsigned long long value) override;
    void Append(unsigned char value) override;
    void Append(unsigned short value) override;
    void Append(unsigned int value) override;
    void Append(unsigned long value) override;
    void Append(signed char value) override;
    void Append(short value) override;
    void Append(int value) override;
    void Append(long value) override;
    void Append(float value) override;
    void Append(double value) override;
    void Append(std::string_view utf8) override;
    void Append(std::u16string_view text) override;
    void AppendFormat(const char *format, ...) override __attribute__((format(printf, 2, 3)));
    void AppendFormatLine(const char *format, ...) override __attribute__((format(printf, 2, 3)));
    std::uint32_t AddRef() noexcept override;
    std::uint32_t Release() override;

private:
    void AppendFormatted(const char *format, std::va_list args);

    ILogGlob &m_glob;
    std::u16string m_text;
    std::atomic<std::uint32_t> m_refCount{1};
    const LineKind m_kind;
    const std::uint32_t m_verbosity;
};

} // namespace cv::util::file::log
