#include "krn/osdep/mutex.h"
#include "krn/osdep/posixerror.h"

#include "childprocess.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

namespace cv::krn::osdep {
namespace {

using namespace std::chrono_literals;

constexpr const char *kHolderVariable = "KRN_TEST_MUTEX_HOLDER";
constexpr std::chrono::milliseconds kDeadline = 20s;

// Started as a helper: open the named mutex, say so, take it, say so, and
// keep it until standard input closes. Runs before main, so no test runs.
const bool kIsHolder = [] {
    const char *name = std::getenv(kHolderVariable);
    if (!name)
        return false;
    std::u16string wide(name, name + std::char_traits<char>::length(name));
    Mutex mutex(wide);
    std::puts("opened");
    std::fflush(stdout);
    mutex.Acquire();
    std::puts("locked");
    std::fflush(stdout);
    char ignored;
    while (::read(STDIN_FILENO, &ignored, 1) > 0) {
    }
    std::_Exit(0);
}();

class KrnMutex : public ::testing::Test
{
protected:
    krntest::ChildProcess StartHolder(const std::string &name)
    {
        return krntest::ChildProcess({std::string(kHolderVariable) + "=" + name});
    }

    testsupport::TempDir m_root;
    std::filesystem::path m_dir = m_root.file("mutexes");
    testsupport::ScopedEnv m_env{"CORVANE_MUTEX_DIR", m_dir.string()};
};

TEST_F(KrnMutex, ADeadHoldersLockIsFreed)
{
    krntest::ChildProcess holder = StartHolder("cv_vek_rovo_global_mutex");
    ASSERT_TRUE(holder.WaitForLine("locked", kDeadline));

    Mutex mutex(u"cv_vek_rovo_global_mutex");
    EXPECT_FALSE(mutex.TryAcquire());
    EXPECT_FALSE(mutex.IsOwned());

    holder.Kill();
    EXPECT_TRUE(mutex.TryAcquire());
    EXPECT_TRUE(mutex.IsOwned());
}

TEST_F(KrnMutex, AWaitingProcessGetsTheMutexOnRelease)
{
    Mutex mutex(u"cv_vek_rovo_valdorn_instance_port");
    ASSERT_TRUE(mutex.TryAcquire());

    krntest::ChildProcess waiter = StartHolder("cv_vek_rovo_valdorn_instance_port");
    ASSERT_TRUE(waiter.WaitForLine("opened", kDeadline));
    // Can only pass wrongly if the waiter is slow, never fail wrongly.
    EXPECT_FALSE(waiter.WaitForLine("locked", 200ms));

    mutex.Release();
    EXPECT_TRUE(waiter.WaitForLine("locked", kDeadline));
    EXPECT_FALSE(mutex.TryAcquire());
}

TEST_F(KrnMutex, TwoObjectsOfOneNameExcludeEachOther)
{
    Mutex first(u"instance");
    Mutex second(u"instance");
    Mutex other(u"Instance");
    ASSERT_TRUE(first.TryAcquire());
    EXPECT_TRUE(first.TryAcquire());
    EXPECT_FALSE(second.TryAcquire());
    EXPECT_TRUE(other.TryAcquire());

    first.Release();
    second.Acquire();
    EXPECT_TRUE(second.IsOwned());
    EXPECT_FALSE(first.TryAcquire());
    second.Release();
    second.Release();

    {
        Mutex scoped(u"instance");
        scoped.Acquire();
    }
    EXPECT_TRUE(first.TryAcquire());
}

TEST_F(KrnMutex, NamesStayInsideTheFolder)
{
    EXPECT_EQ(Mutex::LockFileName(u"cv_vek_rovo_global_mutex"), "cv_vek_rovo_global_mutex.lock");
    EXPECT_EQ(Mutex::LockFileName(u"../etc/passwd"), "..%2Fetc%2Fpasswd.lock");
    EXPECT_EQ(Mutex::LockFileName(u"Global\\a b%"), "Global%5Ca%20b%25.lock");
    EXPECT_EQ(Mutex::LockFileName(u"\u00E4"), "%C3%A4.lock");
    EXPECT_NE(Mutex::LockFileName(u"a/b"), Mutex::LockFileName(u"a%2Fb"));

    for (const char16_t *name : {u"..", u"../escape", u"a/b", u"\\\\server\\x", u""}) {
        Mutex mutex(name);
        EXPECT_TRUE(mutex.TryAcquire());
        EXPECT_EQ(Mutex::LockFilePath(name).parent_path(), m_dir);
        EXPECT_TRUE(std::filesystem::is_regular_file(Mutex::LockFilePath(name)));
    }
    EXPECT_FALSE(std::filesystem::exists(m_root.file("escape.lock")));
}

TEST_F(KrnMutex, EveryoneMayOpenTheFolderAndFiles)
{
    const mode_t previous = ::umask(077);
    {
        Mutex mutex(u"shared");
    }
    ::umask(previous);
    struct stat status = {};
    ASSERT_EQ(::stat(m_dir.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777, 01777u);
    ASSERT_EQ(::stat(Mutex::LockFilePath(u"shared").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777, 0666u);
}

TEST_F(KrnMutex, RefusesWhatIsNotAPlainFile)
{
    std::filesystem::create_directories(m_dir);
    std::ofstream(m_root.file("target")) << "keep";
    std::filesystem::create_symlink(m_root.file("target"), Mutex::LockFilePath(u"link"));
    std::filesystem::create_directory(Mutex::LockFilePath(u"folder"));
    EXPECT_THROW(Mutex(u"link"), PosixError);
    EXPECT_THROW(Mutex(u"folder"), PosixError);

    testsupport::ScopedEnv env("CORVANE_MUTEX_DIR", m_root.file("missing/parent").string());
    try {
        Mutex mutex(u"x");
        FAIL() << "created a mutex below a missing folder";
    } catch (const PosixError &error) {
        EXPECT_EQ(error.Code(), 7u);
        EXPECT_EQ(error.SourceFile(), "Mutex");
        EXPECT_NE(error.SourceLine(), 0u);
    }
}

} // namespace
} // namespace cv::krn::osdep
