#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A value could not be converted to the requested form.
class UnableToConvert final : public Exception
{
public:
    UnableToConvert();
    UnableToConvert(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
