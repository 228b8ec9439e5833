#include "krn/exception/outofrange.h"

#include "krn/utf.h"

namespace cv::krn::exception {

namespace {
constexpr std::string_view kDescription = "Out of range";
} // namespace

OutOfRange::OutOfRange()
    : Exception(std::string(kDescription))
{
}

OutOfRange::OutOfRange(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

OutOfRange::OutOfRange(std::string_view detail)
    : Exception(WithDetail(kDescription, detail))
{
}

OutOfRange::OutOfRange(std::u16string_view detail)
    : Exception(WithDetail(kDescription, ToUtf8(detail)))
{
}

OutOfRange::OutOfRange(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(kDescription, detail), sourceFile, sourceLine)
{
}

OutOfRange::OutOfRange(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(WithDetail(kDescription, ToUtf8(detail)), sourceFile, sourceLine)
{
}

std::uint32_t OutOfRange::Code() const noexcept
{
    return 0x8ABC7007u;
}

} // namespace cv::krn::exception
