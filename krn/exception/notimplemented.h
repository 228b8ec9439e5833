#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// The operation is not available in this build.
class NotImplemented final : public Exception
{
public:
    NotImplemented();
    NotImplemented(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
