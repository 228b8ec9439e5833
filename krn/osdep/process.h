#pragma once

#include <filesystem>
#include <string>

namespace cv::krn::osdep {

// Starts program (no arguments) as a process of its own: a new session,
// not a child of the caller (nothing to reap), at normal priority, and
// inheriting no descriptor of the caller. Its standard input is /dev/null;
// its standard output and error are appended to outputFile (created for its
// owner alone), or go to /dev/null without one or when it cannot be opened.
// So whoever reads the caller's output sees its end when the caller ends,
// however long the program runs. True when the program was executed; false
// when it could not be.
bool StartDetachedProcess(const std::string &program, const std::filesystem::path &outputFile = {});

} // namespace cv::krn::osdep
