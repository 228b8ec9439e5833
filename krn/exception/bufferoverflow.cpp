#include "krn/exception/bufferoverflow.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Buffer overflowed";
}

BufferOverflow::BufferOverflow()
    : Exception(std::string(kDescription))
{
}

BufferOverflow::BufferOverflow(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t BufferOverflow::Code() const noexcept
{
    return 0x8ABC7017u;
}

} // namespace cv::krn::exception
