#include "krn/exception/deserializationerror.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Failed to deserialize";
}

DeserializationError::DeserializationError()
    : Exception(std::string(kDescription))
{
}

DeserializationError::DeserializationError(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t DeserializationError::Code() const noexcept
{
    return 0x8ABC7014u;
}

} // namespace cv::krn::exception
