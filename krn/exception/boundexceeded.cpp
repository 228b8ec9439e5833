#include "krn/exception/boundexceeded.h"

#include "krn/utf.h"

namespace cv::krn::exception {

namespace {
constexpr std::string_view kDescription = "A request was made that would exceed the bounds";
} // namespace

BoundExceeded::BoundExceeded()
    : Exception(std::string(kDescription))
{
}

BoundExceeded::BoundExceeded(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

BoundExceeded::BoundExceeded(std::string_view detail)
    : Exception(WithDetail(kDescription, detail))
{
}

BoundExceeded::BoundExceeded(std::u16string_view detail)
    : Exception(WithDetail(kDescription, ToUtf8(detail)))
{
}

BoundExceeded::BoundExceeded(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(kDescription, detail), sourceFile, sourceLine)
{
}

BoundExceeded::BoundExceeded(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(kDescription, ToUtf8(detail)), sourceFile, sourceLine)
{
}

std::uint32_t BoundExceeded::Code() const noexcept
{
    return 0x8ABC7007u;
}

} // namespace cv::krn::exception
