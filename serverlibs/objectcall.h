#pragma once

// Status calls that hand out an object. The reference is adopted before the
// status is looked at, so an object that arrives together with a failure
// status is released instead of lost when the exception is raised.

#include "entry/errors/statuscall.h"
#include "sorvik/refcounted.h"

#include <cstdint>
#include <type_traits>

namespace cv::vek::rovo::serverlibs {

// call(status) returns T*; the result is a RefPtr<T> holding its reference.
template <typename Call>
auto AdoptWithStatus(Call &&call)
{
    using Object = std::remove_pointer_t<std::invoke_result_t<Call, std::int32_t *>>;
    return CallWithStatus([&](std::int32_t *status) { return krn::RefPtr<Object>::Adopt(call(status)); });
}

// The same for an entry point that may be unresolved (then ifMissing is raised).
template <typename Object, typename... Params, typename... Args>
krn::RefPtr<Object> AdoptFromEntryPoint(const MissingEntryPoint &ifMissing, Object *(*entry)(Params...),
                                        const Args &...args)
{
    if (!entry)
        CallEntryPoint(ifMissing, entry, args...); // raises without calling
    return AdoptWithStatus([&](std::int32_t *status) { return entry(args..., status); });
}

} // namespace cv::vek::rovo::serverlibs
