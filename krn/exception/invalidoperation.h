#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// The object is not in a state that allows the call.
class InvalidOperation final : public Exception
{
public:
    InvalidOperation();
    InvalidOperation(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
