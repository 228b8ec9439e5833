#include "krn/osdep/osexception.h"

namespace cv::krn::osdep {

OSException::OSException()
    : OSException("Unknown error")
{
}

OSException::OSException(std::string description, std::uint32_t errorNumber)
    : Exception(std::move(description))
    , m_errorNumber(errorNumber)
{
}

OSException::OSException(std::string description, std::uint32_t errorNumber, std::string_view sourceFile,
                         std::uint32_t sourceLine)
    : Exception(std::move(description), sourceFile, sourceLine)
    , m_errorNumber(errorNumber)
{
}

std::uint32_t OSException::Code() const noexcept
{
    return 42;
}

std::uint32_t OSException::ErrorNumber() const noexcept
{
    return m_errorNumber;
}

} // namespace cv::krn::osdep
