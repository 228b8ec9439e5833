#pragma once

// The objects of the server API library behind the ABI of sorvik/rovoapi.h.

#include "reference/libsupport/refobject.h"
#include "sorvik/rovoapi.h"

namespace sorvik::rovo {

inline constexpr ref::StatusCodes kCodes{cv::rovo::status::OutOfMemory, cv::rovo::status::InvalidArgument,
                                         cv::rovo::status::Internal};

cv::rovo::IRovoEnvironment *NewEnvironment(cv::vekex::IEnvironment *dataStore);

// Init and Cleanup: while the library is started, a store that passed the
// full check once is not checked in full again.
void TakeUse();
void ReleaseUse();

} // namespace sorvik::rovo
