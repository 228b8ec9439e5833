#pragma once

#include <filesystem>
#include <string>

namespace cv::krn::osdep {

// The folder of the local servers' sockets, shared by client and server so
// that both look in the same place: $CORVANE_RUNTIME_DIR, else
// $XDG_RUNTIME_DIR/corvane when that is an absolute path, else
// /tmp/corvane-run-<uid>. Read from the environment on every call.
std::filesystem::path RuntimeDirectory();

// Whoever can change a folder on the way to a socket can put another
// server's socket there. A path is trusted when it is no symbolic link, is
// owned by this user or by root, and - when it is a folder - nobody else may
// write to it, unless its sticky bit keeps them from replacing what is
// there (as in /tmp). Returns why the path is not trusted, empty when it is;
// a missing path gives the system's text.
std::string UntrustedReason(const std::filesystem::path &path);

// Creates a missing folder for this user alone (0700) and checks it, or
// checks the folder that is there. Returns why it cannot be used, empty when
// it can.
std::string EnsureTrustedFolder(const std::filesystem::path &folder);

} // namespace cv::krn::osdep
