#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::osdep {

// A failure reported by the operating system: a description and the
// platform's error number. Code 42 unless a subclass maps the number.
class OSException : public exception::Exception
{
public:
    OSException();
    explicit OSException(std::string description, std::uint32_t errorNumber = 0);
    OSException(std::string description, std::uint32_t errorNumber, std::string_view sourceFile,
                std::uint32_t sourceLine);

    std::uint32_t Code() const noexcept override;
    virtual std::uint32_t ErrorNumber() const noexcept;

private:
    std::uint32_t m_errorNumber = 0;
};

} // namespace cv::krn::osdep
