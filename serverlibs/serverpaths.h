#pragma once

// Rules for the folder paths that the server keeps. A Sorvik may run on a
// Windows machine, so a path's separator is the one it uses itself: '\' when
// it holds one, else '/'. Comparisons ignore case in the user's locale.

#include <string>
#include <string_view>

namespace cv::vek::rovo::serverlibs {

char16_t SeparatorOf(std::u16string_view path);
bool IsSeparator(char16_t c);

// Without one trailing '\' or '/'; a path of that one character stays as it is.
std::u16string_view WithoutTrailingSeparator(std::u16string_view path);
// Without one leading '\' or '/'.
std::u16string_view WithoutLeadingSeparator(std::u16string_view path);

// True when folder is outer itself or lies inside it. Each path gets its own
// separator appended unless it ends with one, then outer must be a prefix of
// inner. False when either is empty.
bool IsFolderPrefix(std::u16string_view outer, std::u16string_view inner);

// The text after the last '\' or '/', once one trailing separator is dropped.
std::u16string_view LastComponent(std::u16string_view path);

// folder + separator + relative; no separator is doubled or added to an empty part.
std::u16string JoinPath(std::u16string_view folder, std::u16string_view relative, char16_t separator);

} // namespace cv::vek::rovo::serverlibs
