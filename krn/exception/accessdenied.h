#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// Access to a resource was refused; the detail names what and why. Without
// a detail the description is the bare prefix.
class AccessDenied final : public Exception
{
public:
    AccessDenied();
    explicit AccessDenied(std::string_view detail);
    explicit AccessDenied(std::u16string_view detail);
    AccessDenied(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    AccessDenied(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
