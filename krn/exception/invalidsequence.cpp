#include "krn/exception/invalidsequence.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Invalid UTF8 encoding sequence";
}

InvalidSequence::InvalidSequence()
    : Exception(std::string(kDescription))
{
}

InvalidSequence::InvalidSequence(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t InvalidSequence::Code() const noexcept
{
    return 0x8ABC7030u;
}

} // namespace cv::krn::exception
