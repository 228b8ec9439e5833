#include "krn/exception/invalidlocale.h"

namespace cv::krn::exception {

namespace {
constexpr const char *kDescription = "Invalid locale";
}

InvalidLocale::InvalidLocale()
    : Exception(std::string(kDescription))
{
}

InvalidLocale::InvalidLocale(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

std::uint32_t InvalidLocale::Code() const noexcept
{
    return 0x8ABC7024u;
}

} // namespace cv::krn::exception
