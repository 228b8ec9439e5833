#include "krn/exception/notimplemented.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Not implemented";
}

NotImplemented::NotImplemented()
    : Exception(std::string(kDescription))
{
}

NotImplemented::NotImplemented(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t NotImplemented::Code() const noexcept
{
    return 0x80004001u;
}

} // namespace cv::krn::exception
