#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// Reading a file failed.
class FileReadFailed final : public Exception
{
public:
    FileReadFailed();
    FileReadFailed(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
