#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A file that was to be created is already there.
class FileAlreadyExists final : public Exception
{
public:
    FileAlreadyExists();
    FileAlreadyExists(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
