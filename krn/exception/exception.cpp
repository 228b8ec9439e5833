#include "krn/exception/exception.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kUnspecified = "unspecified exception";
}

Exception::Exception()
    : Exception(std::string(kUnspecified))
{
}

Exception::Exception(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kUnspecified), sourceFile, sourceLine)
{
}

Exception::Exception(std::string description)
    : m_description(std::make_shared<const std::string>(std::move(description)))
{
}

Exception::Exception(std::string description, std::string_view sourceFile, std::uint32_t sourceLine)
    : m_description(std::make_shared<const std::string>(std::move(description)))
    , m_sourceFile(std::make_shared<const std::string>(sourceFile))
    , m_sourceLine(sourceLine)
{
}

Exception::~Exception() = default;

std::string Exception::WithDetail(std::string_view prefix, std::string_view detail)
{
    std::string text(prefix);
    text += ": ";
    text += detail;
    return text;
}

std::string Exception::Description() const
{
    return *m_description;
}

std::uint32_t Exception::Code() const noexcept
{
    return 0xFFFFFFFFu;
}

const char *Exception::what() const noexcept
{
    return m_description->c_str();
}

std::optional<std::string> Exception::SourceFile() const
{
    if (!m_sourceFile)
        return std::nullopt;
    return *m_sourceFile;
}

} // namespace cv::krn::exception
