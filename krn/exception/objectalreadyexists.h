#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::exception {

// A named object that was to be created is already there.
class ObjectAlreadyExists final : public Exception
{
public:
    ObjectAlreadyExists();
    ObjectAlreadyExists(std::string_view sourceFile, std::uint32_t sourceLine);
    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::exception
