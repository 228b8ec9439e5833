#include "krn/exception/filewritefailed.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Write file operation failed";
}

FileWriteFailed::FileWriteFailed()
    : Exception(std::string(kDescription))
{
}

FileWriteFailed::FileWriteFailed(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t FileWriteFailed::Code() const noexcept
{
    return 0x8ABC7011u;
}

} // namespace cv::krn::exception
