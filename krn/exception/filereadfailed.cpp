#include "krn/exception/filereadfailed.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Read file operation failed";
}

FileReadFailed::FileReadFailed()
    : Exception(std::string(kDescription))
{
}

FileReadFailed::FileReadFailed(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t FileReadFailed::Code() const noexcept
{
    return 0x8ABC7012u;
}

} // namespace cv::krn::exception
