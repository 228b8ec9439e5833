#pragma once

// The objects of the data-store library behind the ABI of sorvik/vekex.h.

#include "reference/libsupport/refobject.h"
#include "sorvik/vekex.h"
#include "reference/vekex/catalogue.h"

#include <memory>

namespace sorvik::vekex {

inline constexpr ref::StatusCodes kCodes{cv::vekex::status::OutOfMemory, cv::vekex::status::InvalidArgument,
                                         cv::vekex::status::Internal};

cv::vekex::IEnvironment *NewEnvironment(std::int32_t kind);
cv::vekex::IContainer *NewContainer();
cv::vekex::IInstList *NewInstList();
cv::vekex::IContainerList *NewContainerList();

// The catalogue for a new configuration: read again unless the library is
// started (Init) and the file is unchanged since it was last read.
std::shared_ptr<const Catalogue> CurrentCatalogue();
void TakeUse();
void ReleaseUse();

} // namespace sorvik::vekex
