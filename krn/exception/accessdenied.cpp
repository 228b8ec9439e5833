#include "krn/exception/accessdenied.h"

#include "krn/utf.h"

namespace cv::krn::exception {

namespace {
std::string WithDetail(std::string_view detail)
{
    std::string text = "Access denied: ";
    text += detail;
    return text;
}
} // namespace

AccessDenied::AccessDenied()
    : Exception(WithDetail({}))
{
}

AccessDenied::AccessDenied(std::string_view detail)
    : Exception(WithDetail(detail))
{
}

AccessDenied::AccessDenied(std::u16string_view detail)
    : Exception(WithDetail(ToUtf8(detail)))
{
}

AccessDenied::AccessDenied(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(detail), sourceFile, sourceLine)
{
}

AccessDenied::AccessDenied(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(ToUtf8(detail)), sourceFile, sourceLine)
{
}

std::uint32_t AccessDenied::Code() const noexcept
{
    return 0x8ABC7019u;
}

} // namespace cv::krn::exception
