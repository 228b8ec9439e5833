#pragma once

#include "log/linekind.h"

#include <cstdint>
#include <string_view>

namespace cv::util::file::log {

// Where finished lines go.
class ILogGlob
{
public:
    // text has no line end; the sink adds it where its output needs one.
    virtual void WriteLine(std::u16string_view text, LineKind kind, std::uint32_t verbosity) = 0;
    // "\r\n"
    virtual std::u16string_view LineEnd() const = 0;

protected:
    ~ILogGlob() = default;
};

} // namespace cv::util::file::log
