#pragma once

#include <string>

namespace cv::krn::osdep {

// Starts program (no arguments) as a process of its own: a new session,
// not a child of the caller (nothing to reap), at normal priority, and
// inheriting no descriptor beyond standard input, output and error. True
// when the program was executed; false when it could not be.
bool StartDetachedProcess(const std::string &program);

} // namespace cv::krn::osdep
