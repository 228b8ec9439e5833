#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A request would grow something past its limit.
// The detail variant appends ": " and the detail to the description; a
// UTF-16 detail is converted to UTF-8 at construction.
class BoundExceeded final : public Exception
{
public:
    BoundExceeded();
    BoundExceeded(std::string_view sourceFile, std::uint32_t sourceLine);
    explicit BoundExceeded(std::string_view detail);
    explicit BoundExceeded(std::u16string_view detail);
    BoundExceeded(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    BoundExceeded(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
