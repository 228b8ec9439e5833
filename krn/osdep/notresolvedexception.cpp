#include "krn/osdep/notresolvedexception.h"

namespace cv::krn::osdep {

namespace {
constexpr const char *kDescription = "Not able to resolve the network name or address";
}

NotResolvedException::NotResolvedException()
    : Exception(std::string(kDescription))
{
}

NotResolvedException::NotResolvedException(std::string_view sourceFile, std::uint32_t sourceLine)
    : Exception(std::string(kDescription), sourceFile, sourceLine)
{
}

} // namespace cv::krn::osdep
