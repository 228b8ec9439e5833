#pragma once

#include <cstddef>

namespace testsupport {

// The largest single allocation through the global operator new since the
// last reset, in bytes. The test executable replaces operator new for this.
void ResetLargestAllocation();
std::size_t LargestAllocation();

} // namespace testsupport
