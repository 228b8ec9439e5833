#include "krn/exception/objectalreadyexists.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Object already exists";
}

ObjectAlreadyExists::ObjectAlreadyExists()
    : Exception(std::string(kDescription))
{
}

ObjectAlreadyExists::ObjectAlreadyExists(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t ObjectAlreadyExists::Code() const noexcept
{
    return 0x8ABC7009u;
}

} // namespace cv::krn::exception
