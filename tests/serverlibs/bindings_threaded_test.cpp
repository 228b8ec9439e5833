#include "serverlibs/testlibraries.h"
#include "serverlibs/vekexlibrary.h"
#include "sorvik/vekexception.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

namespace cv::vek::rovo::serverlibs {
namespace {

TEST(ServerLibraryUsesThreaded, DataStoreUsesFromManyThreadsNeverLoseTheLibrary)
{
    const testsupport::ScopedLibraryFolders folders(FAKE_FULL_DIR, FAKE_FULL_DIR);
    VekexLibrary vekex;
    std::atomic<int> failures{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([&] {
            for (int i = 0; i < 150; ++i) {
                vekex.TakeUse();
                try {
                    vekex.CreateContainer(); // -1006 if the library went while a use is held
                } catch (const Exception &) {
                    ++failures;
                }
                vekex.ReleaseUse();
            }
        });
    }
    for (auto &thread : threads)
        thread.join();
    EXPECT_EQ(failures.load(), 0);
    EXPECT_EQ(vekex.UseCount(), 0u);
    EXPECT_FALSE(testsupport::IsLoaded(FAKE_FULL_DIR "/libvekex.so"));
}

} // namespace
} // namespace cv::vek::rovo::serverlibs
