#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A locale name was not recognised.
class InvalidLocale final : public Exception
{
public:
    InvalidLocale();
    InvalidLocale(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
