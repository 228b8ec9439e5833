#pragma once

#include "krn/osdep/osexception.h"

namespace cv::krn::osdep {

// A system error whose code follows the Windows error-number table, so that
// callers written against those codes keep branching the same way. Built
// from an explicit number or from the calling thread's errno; described by
// the system's message for it.
class WinError final : public OSException
{
public:
    // These two read errno before anything else can change it.
    WinError();
    WinError(std::string_view sourceFile, std::uint32_t sourceLine);

    explicit WinError(std::uint32_t errorNumber);
    WinError(std::uint32_t errorNumber, std::string_view sourceFile, std::uint32_t sourceLine);

    std::uint32_t Code() const noexcept override;
};

} // namespace cv::krn::osdep
