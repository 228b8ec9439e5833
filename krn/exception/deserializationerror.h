#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// Received data ended early or did not decode.
class DeserializationError final : public Exception
{
public:
    DeserializationError();
    DeserializationError(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
