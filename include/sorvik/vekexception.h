#pragma once

// The module's one exception type, and the value a page throws when it has
// already told the user why it rejects the input. Service operations let
// cv::vek::Exception pass to the host, so it is part of the ABI: default
// visibility keeps its type information one across libraries.

#include "sorvik/com.h"
#include "sorvik/wstring.h"

#include <cstdint>
#include <utility>

namespace cv::vek {

class SORVIK_EXPORT Exception
{
public:
    Exception(std::int32_t code, krn::WString message) : m_code(code), m_message(std::move(message)) {}
    Exception(const Exception &) = default;
    Exception &operator=(const Exception &) = default;
    virtual ~Exception() = default;

    std::int32_t Code() const noexcept { return m_code; }
    const krn::WString &Message() const noexcept { return m_message; }

private:
    std::int32_t m_code;
    krn::WString m_message;
};

namespace com {

enum cErrCode : std::int32_t {
    // The input was rejected and the user has already been told why; the
    // surrounding dialog stays open.
    errInputRejected = 21,
};

} // namespace com

namespace errors {

constexpr std::int32_t OutOfMemory = -800;
constexpr std::int32_t ShouldNeverBeHere = -1001;
constexpr std::int32_t VekNotInitialized = -1006;
constexpr std::int32_t InvalidParameter = -1007;
constexpr std::int32_t UpdateTimedOut = -1008;
constexpr std::int32_t CannotConnect = -1333;
constexpr std::int32_t RovoNotInitialized = -13001;

} // namespace errors

} // namespace cv::vek
