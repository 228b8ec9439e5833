#pragma once

// Calls into the run-time-loaded product libraries report failure through a
// trailing `std::int32_t *status`. These helpers turn a missing entry point or
// a non-zero status into cv::vek::Exception, so no caller checks by hand.

#include "sorvik/vekexception.h"

#include <cstdint>
#include <type_traits>
#include <utility>

namespace cv::vek {

// What a library's wrappers raise when its entry point was not resolved.
struct MissingEntryPoint
{
    std::int32_t code;
    const char16_t *message;
};

inline constexpr MissingEntryPoint kVekNotInitialized{errors::VekNotInitialized, u"vek not correctly initialized"};
inline constexpr MissingEntryPoint kRovoNotInitialized{errors::RovoNotInitialized,
                                                       u"rovo not correctly initialized"};

// Runs call(&status) with status starting at 0. A non-zero status becomes
// Exception(status, empty text) and whatever the call returned is discarded.
template <typename Call>
auto CallWithStatus(Call &&call) -> std::invoke_result_t<Call, std::int32_t *>
{
    std::int32_t status = 0;
    if constexpr (std::is_void_v<std::invoke_result_t<Call, std::int32_t *>>) {
        std::forward<Call>(call)(&status);
        if (status != 0)
            throw Exception(status, {});
    } else {
        auto result = std::forward<Call>(call)(&status);
        if (status != 0)
            throw Exception(status, {});
        return result;
    }
}

// Calls a resolved entry point with the given arguments and a status pointer;
// a null entry point raises ifMissing without any call.
template <typename Result, typename... Params, typename... Args>
Result CallEntryPoint(const MissingEntryPoint &ifMissing, Result (*entry)(Params...), Args &&...args)
{
    if (!entry)
        throw Exception(ifMissing.code, krn::WString(ifMissing.message));
    return CallWithStatus([&](std::int32_t *status) { return entry(std::forward<Args>(args)..., status); });
}

} // namespace cv::vek
