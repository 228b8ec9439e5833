#include "krn/osdep/runtimefolder.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

namespace {

using namespace cv::krn::osdep;
using testsupport::ScopedEnv;

constexpr uid_t kNobody = 65534;

mode_t ModeOf(const std::filesystem::path &path)
{
    struct stat status = {};
    EXPECT_EQ(::lstat(path.c_str(), &status), 0);
    return status.st_mode & 07777;
}

TEST(RuntimeDirectory, ConfiguredThenSessionThenPerUserInTmp)
{
    ScopedEnv configured("CORVANE_RUNTIME_DIR", "/somewhere/run");
    ScopedEnv session("XDG_RUNTIME_DIR", "/run/user/1234");
    EXPECT_EQ(RuntimeDirectory(), "/somewhere/run");

    ScopedEnv unconfigured("CORVANE_RUNTIME_DIR", std::nullopt);
    EXPECT_EQ(RuntimeDirectory(), "/run/user/1234/corvane");

    const std::filesystem::path perUser = "/tmp/corvane-run-" + std::to_string(::geteuid());
    ScopedEnv relative("XDG_RUNTIME_DIR", "run/user");
    EXPECT_EQ(RuntimeDirectory(), perUser);
    ScopedEnv none("XDG_RUNTIME_DIR", std::nullopt);
    EXPECT_EQ(RuntimeDirectory(), perUser);
}

TEST(TrustedFolder, IsCreatedForThisUserAloneAndCheckedWhenThere)
{
    testsupport::TempDir dir;
    const auto folder = dir.file("run");
    EXPECT_EQ(EnsureTrustedFolder(folder), "");
    EXPECT_EQ(ModeOf(folder), 0700u);
    EXPECT_EQ(EnsureTrustedFolder(folder), "") << "an existing folder of this user";

    // Writable by others is fine only where the sticky bit keeps what is there.
    ASSERT_EQ(::chmod(folder.c_str(), 0777), 0);
    EXPECT_NE(EnsureTrustedFolder(folder).find("may be changed by other users"), std::string::npos);
    ASSERT_EQ(::chmod(folder.c_str(), 01777), 0);
    EXPECT_EQ(UntrustedReason(folder), "");

    std::filesystem::create_directory_symlink(folder, dir.file("link"));
    EXPECT_NE(UntrustedReason(dir.file("link")).find("symbolic link"), std::string::npos);
    EXPECT_NE(UntrustedReason(dir.file("missing")).find("No such file"), std::string::npos);
    { std::ofstream(dir.file("plain")); }
    EXPECT_NE(EnsureTrustedFolder(dir.file("plain")).find("not a folder"), std::string::npos);
}

TEST(TrustedFolder, AFolderOfAnotherUserIsRefusedByName)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can give a folder to another user";
    testsupport::TempDir dir;
    const auto folder = dir.file("planted");
    ASSERT_EQ(::mkdir(folder.c_str(), 0755), 0);
    ASSERT_EQ(::chown(folder.c_str(), kNobody, kNobody), 0);
    const std::string reason = EnsureTrustedFolder(folder);
    EXPECT_NE(reason.find(folder.string()), std::string::npos) << reason;
    EXPECT_NE(reason.find("belongs to user 65534"), std::string::npos) << reason;
}

} // namespace
