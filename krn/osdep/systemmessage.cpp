#include "krn/osdep/systemmessage.h"

#include <climits>
#include <cstring>

namespace cv::krn::osdep {

namespace {

// strerror_r comes in two shapes; overloads pick whichever the C library has.
[[maybe_unused]] const char *Pick(const char *gnuResult, const char *)
{
    return gnuResult;
}

[[maybe_unused]] const char *Pick(int xsiResult, const char *buffer)
{
    return xsiResult == 0 ? buffer : nullptr;
}

} // namespace

std::string SystemMessage(std::uint32_t errorNumber)
{
    if (errorNumber > static_cast<std::uint32_t>(INT_MAX))
        return "Unknown error " + std::to_string(errorNumber);
    char buffer[256] = {};
    const char *text = Pick(::strerror_r(static_cast<int>(errorNumber), buffer, sizeof buffer), buffer);
    if (!text || !*text)
        return "Unknown error " + std::to_string(errorNumber);
    return text;
}

} // namespace cv::krn::osdep
