#pragma once

#include <filesystem>
#include <string>
#include <string_view>

namespace cv::krn::osdep {

// A mutex shared by name between processes ("Global\" + name in Windows
// terms). It is an exclusive flock(2) lock on <MutexDirectory()>/<file>.lock.
//
// File names: the name's UTF-8 bytes, where every byte other than an ASCII
// letter, digit, '-', '_' or '.' is written as '%' and two upper-case hex
// digits ("a/b" -> "a%2Fb", "Global\x" -> "Global%5Cx", "%" -> "%25"). A name
// therefore never leaves the folder, and distinct names give distinct files.
// The "Global\" prefix itself is not part of the file name: the folder is
// the global name space.
//
// The folder is created with mode 1777 and lock files with mode 0666,
// regardless of the umask, so that every user may open them; lock files are
// never followed through symbolic links. The kernel drops the lock of a
// process that dies, so an abandoned mutex is simply acquired.
//
// flock locks belong to the open file, so two Mutex objects of the same name
// exclude each other even within one process. The lock is not recursive:
// acquiring it again while owning it changes nothing, and one Release frees
// it. One object is used by one thread at a time.
class Mutex final
{
public:
    // Creates or opens the named mutex, not owned. Raises PosixError.
    explicit Mutex(std::u16string_view name);
    // Releases the mutex first when this object owns it.
    ~Mutex();

    Mutex(const Mutex &) = delete;
    Mutex &operator=(const Mutex &) = delete;

    // Takes the mutex without waiting: false only when another holder has it.
    bool TryAcquire();
    // Waits without time limit until the mutex is taken.
    void Acquire();
    // Gives up ownership; does nothing when not owned.
    void Release();

    bool IsOwned() const noexcept { return m_owned; }

    static std::string LockFileName(std::u16string_view name);
    static std::filesystem::path LockFilePath(std::u16string_view name);

private:
    int m_fd = -1;
    bool m_owned = false;
};

} // namespace cv::krn::osdep
