#include "krn/exception/invalidargument.h"

#include "krn/utf.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Invalid argument(s)";
}

InvalidArgument::InvalidArgument()
    : Exception(std::string(kDescription))
{
}

InvalidArgument::InvalidArgument(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

InvalidArgument::InvalidArgument(std::string_view detail)
    : Exception(std::string(detail))
{
}

InvalidArgument::InvalidArgument(std::u16string_view detail)
    : Exception(ToUtf8(detail))
{
}

InvalidArgument::InvalidArgument(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(detail), sourceFile, sourceLine)
{
}

InvalidArgument::InvalidArgument(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(ToUtf8(detail), sourceFile, sourceLine)
{
}

std::uint32_t InvalidArgument::Code() const noexcept
{
    return 0x8ABC700Fu;
}

} // namespace cv::krn::exception
