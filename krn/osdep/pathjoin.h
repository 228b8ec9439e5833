#pragma once

#include <string>
#include <string_view>

namespace cv::krn::osdep {

// Joins a folder and a file name. The file name alone comes back when the
// folder is empty or the file name is absolute (it starts with '/' or '\',
// or with a drive letter and ':'). Otherwise the separator is '\' when the
// folder holds one (a Windows server's path), else '/', and a separator
// that already ends the folder is not doubled.
std::u16string PathJoin(std::u16string_view folder, std::u16string_view file);
std::string PathJoin(std::string_view folder, std::string_view file);

} // namespace cv::krn::osdep
