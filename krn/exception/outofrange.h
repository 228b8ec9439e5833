#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A value or index lies outside its permitted range.
// The detail variant appends ": " and the detail to the description; a
// UTF-16 detail is converted to UTF-8 at construction.
class OutOfRange final : public Exception
{
public:
    OutOfRange();
    OutOfRange(std::string_view sourceFile, std::uint32_t sourceLine);
    explicit OutOfRange(std::string_view detail);
    explicit OutOfRange(std::u16string_view detail);
    OutOfRange(std::string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    OutOfRange(std::u16string_view detail, std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
