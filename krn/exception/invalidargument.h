#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A caller passed an argument the operation cannot use. The detail variant
// describes itself by the detail text alone.
class InvalidArgument final : public Exception
{
public:
    InvalidArgument();
    InvalidArgument(std::string_view sourceFile, std::uint32_t sourceLine);
    explicit InvalidArgument(std::string_view detail);
    explicit InvalidArgument(std::u16string_view detail);
    InvalidArgument(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    InvalidArgument(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
