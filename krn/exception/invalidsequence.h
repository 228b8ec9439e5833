#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A narrow text was not valid UTF-8.
class InvalidSequence final : public Exception
{
public:
    InvalidSequence();
    InvalidSequence(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
