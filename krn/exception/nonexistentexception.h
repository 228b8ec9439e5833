#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A named object that was looked up is not there.
class NonexistentException final : public Exception
{
public:
    NonexistentException();
    NonexistentException(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
