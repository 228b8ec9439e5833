#pragma once

#include "log/ilogout.h"

#include <cstdint>

namespace cv::util::file::log {

// Writing to a log. Each call starts one line and returns the handle to append
// its text to; the source file (may be null) and line feed the optional
// source-position prefix.
class ILog
{
public:
    virtual ILogOut FatalError(const char *sourceFile, int line) = 0;
    virtual ILogOut Error(const char *sourceFile, int line) = 0;
    virtual ILogOut Warning(const char *sourceFile, int line) = 0;
    // Written only when bit (verbosity % 32) of the info mask is set.
    virtual ILogOut Info(const char *sourceFile, int line, std::uint32_t verbosity) = 0;
    virtual ~ILog() = default;

    ILog(const ILog &) = delete;
    ILog &operator=(const ILog &) = delete;

protected:
    ILog() = default;
};

} // namespace cv::util::file::log
