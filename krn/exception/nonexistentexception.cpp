#include "krn/exception/nonexistentexception.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "The object does not exist";
}

NonexistentException::NonexistentException()
    : Exception(std::string(kDescription))
{
}

NonexistentException::NonexistentException(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t NonexistentException::Code() const noexcept
{
    return 0x8ABC700Au;
}

} // namespace cv::krn::exception
