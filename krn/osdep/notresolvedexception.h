#pragma once

#include "krn/exception/exception.h"

namespace cv::krn::osdep {

// A host name or address that the resolver could not turn into addresses.
class NotResolvedException final : public exception::Exception
{
public:
    NotResolvedException();
    NotResolvedException(std::string_view sourceFile, std::uint32_t sourceLine);
};

} // namespace cv::krn::osdep
