#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// Writing a file failed.
class FileWriteFailed final : public Exception
{
public:
    FileWriteFailed();
    FileWriteFailed(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
