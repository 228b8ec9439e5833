#include "krn/exception/unabletoconvert.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Unable to convert.";
}

UnableToConvert::UnableToConvert()
    : Exception(std::string(kDescription))
{
}

UnableToConvert::UnableToConvert(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t UnableToConvert::Code() const noexcept
{
    return 0x8ABC7034u;
}

} // namespace cv::krn::exception
