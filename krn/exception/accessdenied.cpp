#include "krn/exception/accessdenied.h"

#include "krn/utf.h"

namespace cv::krn::exception {

namespace {
constexpr std::string_view kDescription = "Access denied";
} // namespace

AccessDenied::AccessDenied()
    : Exception(WithDetail(kDescription, {}))
{
}

AccessDenied::AccessDenied(std::string_view detail)
    : Exception(WithDetail(kDescription, detail))
{
}

AccessDenied::AccessDenied(std::u16string_view detail)
    : Exception(WithDetail(kDescription, ToUtf8(detail)))
{
}

AccessDenied::AccessDenied(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(kDescription, detail), sourceFile, sourceLine)
{
}

AccessDenied::AccessDenied(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(kDescription, ToUtf8(detail)), sourceFile, sourceLine)
{
}

std::uint32_t AccessDenied::Code() const noexcept
{
    return 0x8ABC7019u;
}

} // namespace cv::krn::exception
