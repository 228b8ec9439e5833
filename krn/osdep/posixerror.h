#pragma once

#include "krn/osdep/osexception.h"

namespace cv::krn::osdep {

// A POSIX system error: code 0 for no error, 7 for a missing file, else 42.
// Built from an explicit number or from the calling thread's errno;
// described by the system's message for it.
class PosixError final : public OSException
{
public:
    // These two read errno before anything else can change it.
    PosixError();
    PosixError(std::string_view sourceFile, std::uint32_t sourceLine);

    explicit PosixError(std::uint32_t errorNumber);
    PosixError(std::uint32_t errorNumber, std::string_view sourceFile, std::uint32_t sourceLine);

    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::osdep
