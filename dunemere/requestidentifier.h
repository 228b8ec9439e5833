#pragma once

#include "sorvik/com.h"

#include <string>

namespace cv::vek::rovo {

// A fresh random (version 4) GUID for a request record.
GUID NewRequestIdentifier();

// Upper-case 8-4-4-4-12 hexadecimal form without braces, as the client proof
// expects it.
std::string RequestIdentifierText(const GUID &identifier);
void AppendRequestIdentifierText(const GUID &identifier, std::string &out);

} // namespace cv::vek::rovo
