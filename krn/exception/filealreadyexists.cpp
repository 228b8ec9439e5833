#include "krn/exception/filealreadyexists.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "File already exists";
}

FileAlreadyExists::FileAlreadyExists()
    : Exception(std::string(kDescription))
{
}

FileAlreadyExists::FileAlreadyExists(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t FileAlreadyExists::Code() const noexcept
{
    return 0x8ABC701Bu;
}

} // namespace cv::krn::exception
