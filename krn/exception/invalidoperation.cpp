#include "krn/exception/invalidoperation.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Invalid operation";
}

InvalidOperation::InvalidOperation()
    : Exception(std::string(kDescription))
{
}

InvalidOperation::InvalidOperation(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t InvalidOperation::Code() const noexcept
{
    return 0x8ABC700Eu;
}

} // namespace cv::krn::exception
