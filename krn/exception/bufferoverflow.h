#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// Data did not fit into a fixed-size buffer.
class BufferOverflow final : public Exception
{
public:
    BufferOverflow();
    BufferOverflow(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
