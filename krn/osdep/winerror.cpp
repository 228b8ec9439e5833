#include "krn/osdep/winerror.h"

#include "krn/osdep/systemmessage.h"

#include <cerrno>

namespace cv::krn::osdep {

namespace {

std::uint32_t LastError()
{
    return static_cast<std::uint32_t>(errno);
}

} // namespace

WinError::WinError()
    : WinError(LastError())
{
}

WinError::WinError(std::string_view sourceFile, std::uint32_t sourceLine)
    : WinError(LastError(), sourceFile, sourceLine)
{
}

WinError::WinError(std::uint32_t errorNumber)
    : OSException(SystemMessage(errorNumber), errorNumber)
{
}

WinError::WinError(std::uint32_t errorNumber, std::string_view sourceFile, std::uint32_t sourceLine)
    : OSException(SystemMessage(errorNumber), errorNumber, sourceFile, sourceLine)
{
}

std::uint32_t WinError::Code() const noexcept
{
    switch (ErrorNumber()) {
    case 0:
        return 0;
    case 2:
    case 3:
    case 15:
        return 7;
    case 4:
        return 11;
    case 5:
        return 0x80070005u;
    case 6:
    case 87:
        return 1;
    case 8:
    case 14:
        return 2;
    case 11:
        return 23;
    case 16:
    case 19:
    case 32:
    case 33:
        return 8;
    case 20:
        return 37;
    case 23:
        return 0xFFFFFE04u;
    case 38:
        return 4;
    case 39:
        return 9;
    case 80:
        return 0xFFFFFF9Eu;
    default:
        return 42;
    }
}

} // namespace cv::krn::osdep
