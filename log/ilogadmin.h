#pragma once

#include "log/ilog.h"

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace cv::util::file::log {

// Output flags of a log. A line is written only when one of the low eight
// bits is set.
inline constexpr std::uint32_t kOutputConsole = 1u << 0;
inline constexpr std::uint32_t kOutputFile = 1u << 1; // follows the file name
inline constexpr std::uint32_t kOutputDebugger = 1u << 2;
inline constexpr std::uint32_t kOutputAdditional = 1u << 3;
inline constexpr std::uint32_t kOutputAdditionalSwitch = 1u << 4; // owned by IAdditionalOutputCallBack
inline constexpr std::uint32_t kOutputChannels = 0xFFu;
inline constexpr std::uint32_t kOutputElapsedTime = 1u << 30;    // "T=<seconds>s: "
inline constexpr std::uint32_t kOutputSourcePosition = 1u << 31; // "<file>(<line>): "

// Setting up a log.
class ILogAdmin : public ILog
{
public:
    // The next written line opens the file again, with a new section banner.
    virtual void CloseFile() = 0;
    // Flushes the file to disk, and the console when console output is on.
    virtual void Flush() = 0;
    // Closes and removes the log file; the next written line creates it anew.
    virtual void DeleteFile() = 0;
    // A different name closes the open file; the file flag is set exactly when
    // the name is not empty.
    virtual void SetFileName(std::u16string_view fileName) = 0;
    virtual void SetInfoMask(std::uint32_t mask) = 0;
    // Takes every bit except kOutputAdditionalSwitch, which keeps its value.
    virtual void SetOutputFlags(std::uint32_t flags) = 0;
    virtual std::uint32_t GetInfoMask() const = 0;
    virtual std::uint32_t GetOutputFlags() const = 0;
    // Every warning call, and every error and fatal-error call, counts,
    // whether it was written or not.
    virtual std::uint64_t GetWarningCount() const = 0;
    virtual std::uint64_t GetErrorCount() const = 0;
    // In KiB; 0 means no limit. Past the limit, writing goes on just behind the
    // byte-order mark, over the oldest lines.
    virtual void SetMaxFileSize(std::uint32_t kib) = 0;
    virtual std::uint32_t GetMaxFileSize() const = 0;
    // Copies the file name and a terminating NUL into buffer. Capacity counts
    // the terminator, so a name of n characters needs n + 1. When it does not
    // fit, buffer receives an empty text (if capacity > 0) and false is returned.
    virtual bool GetFileName(char16_t *buffer, std::size_t capacity) const = 0;
};

} // namespace cv::util::file::log
