#include "krn/osdep/posixerror.h"

#include "krn/osdep/systemmessage.h"

#include <cerrno>

namespace cv::krn::osdep {

namespace {

std::uint32_t LastError()
{
    return static_cast<std::uint32_t>(errno);
}

} // namespace

PosixError::PosixError()
    : PosixError(LastError())
{
}

PosixError::PosixError(std::string_view sourceFile, std::uint32_t sourceLine)
    : PosixError(LastError(), sourceFile, sourceLine)
{
}

PosixError::PosixError(std::uint32_t errorNumber)
    : OSException(SystemMessage(errorNumber), errorNumber)
{
}

PosixError::PosixError(std::uint32_t errorNumber, std::string_view sourceFile, std::uint32_t sourceLine)
    : OSException(SystemMessage(errorNumber), errorNumber, sourceFile, sourceLine)
{
}

std::uint32_t PosixError::Code() const noexcept
{
    switch (ErrorNumber()) {
    case 0:
        return 0;
    case ENOENT:
        return 7;
    default:
        return 42;
    }
}

} // namespace cv::krn::osdep
