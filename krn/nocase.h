#pragma once

// The one way the module compares names and paths without regard to case:
// in the user's locale, as the user sees them.

#include <string_view>

namespace cv::krn {

// Negative, zero or positive, like a three-way comparison.
int CompareNoCase(std::u16string_view a, std::u16string_view b);

bool EqualsNoCase(std::u16string_view a, std::u16string_view b);

// True when the first prefix.size() characters of text equal prefix.
bool StartsWithNoCase(std::u16string_view text, std::u16string_view prefix);

// A strict weak order for maps and sorting.
struct LessNoCase
{
    bool operator()(std::u16string_view a, std::u16string_view b) const { return CompareNoCase(a, b) < 0; }
};

} // namespace cv::krn
