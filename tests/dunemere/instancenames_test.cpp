#include "dunemere/instancenames.h"

#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fstream>

namespace {

using namespace cv::vek::rovo::dunemere;

TEST(InstanceNames, AreThePrefixAndThePortName)
{
    EXPECT_EQ(InstanceMutexName(u"P1"), u"cv_vek_rovo_valdorn_instance_P1");
    EXPECT_EQ(InstanceMutexName(u""), u"cv_vek_rovo_valdorn_instance_");
    EXPECT_EQ(kGlobalServerMutexName, u"cv_vek_rovo_global_mutex");
}

TEST(InstanceNames, AHeldInstanceMutexIsSeenByOthers)
{
    testsupport::TempDir dir;
    testsupport::ScopedEnv mutexDir("CORVANE_MUTEX_DIR", dir.path().string());
    const auto server = OpenInstanceMutex(u"P1");
    ASSERT_TRUE(server->TryAcquire());
    EXPECT_FALSE(OpenInstanceMutex(u"P1")->TryAcquire());
    EXPECT_TRUE(OpenInstanceMutex(u"P2")->TryAcquire());
    EXPECT_TRUE(OpenGlobalServerMutex()->TryAcquire());
    server->Release();
    EXPECT_TRUE(OpenInstanceMutex(u"P1")->TryAcquire());
}

TEST(InstanceNames, ServerFolderComesFromTheDesktopKey)
{
    testsupport::TempDir dir;
    testsupport::ScopedEnv registry("CORVANE_REGISTRY", dir.file("registry.ini").string());

    // No file, then a file without the key: the bare executable name.
    EXPECT_EQ(ServerFolder(), u"");
    EXPECT_EQ(ServerExecutablePath(), u"Sorvik");
    std::ofstream(dir.file("registry.ini")) << "[Software\\Corvane\\Common\\Sorvik]\nbinDir=/opt/lib\n";
    EXPECT_EQ(ServerExecutablePath(), u"Sorvik");

    std::ofstream(dir.file("registry.ini")) << "[software\\corvane\\common\\sorvikdesktop]\nBINDIR=/opt/sorvik/bin\n";
    EXPECT_EQ(ServerFolder(), u"/opt/sorvik/bin");
    EXPECT_EQ(ServerExecutablePath(), u"/opt/sorvik/bin/Sorvik");
}

} // namespace
