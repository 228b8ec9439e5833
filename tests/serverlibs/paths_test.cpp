#include "serverlibs/productlibrary.h"
#include "serverlibs/serverpaths.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fstream>

namespace cv::vek::rovo::serverlibs {
namespace {

TEST(ProductLibraryPath, RegistryFolderWithItsOwnSeparatorElseTheBareName)
{
    testsupport::TempDir dir;
    const testsupport::ScopedEnv registry("CORVANE_REGISTRY", dir.file("registry.ini").string());
    const auto pathFor = [&](const std::string &binDir) {
        std::ofstream(dir.file("registry.ini")) << "[software\\corvane\\common\\sorvik]\nBINDIR=" << binDir << "\n";
        return ProductLibraryPath(u"Software\\Corvane\\Common\\Sorvik", u"librovoApi.so");
    };
    EXPECT_EQ(pathFor("/opt/lib"), u"/opt/lib/librovoApi.so");
    EXPECT_EQ(pathFor("/opt/lib/"), u"/opt/lib/librovoApi.so");
    EXPECT_EQ(pathFor("C:\\Sorvik"), u"C:\\Sorvik\\librovoApi.so");
    EXPECT_EQ(pathFor(""), u"librovoApi.so");

    // The registry is read into 2000 bytes: 999 UTF-16 characters and the terminator.
    const std::string longest = "/" + std::string(998, 'x');
    EXPECT_EQ(pathFor(longest).size(), longest.size() + 14);
    EXPECT_EQ(pathFor(longest + "x"), u"librovoApi.so") << "a cut-off folder would name another one";
}

TEST(ServerPaths, SeparatorRules)
{
    EXPECT_TRUE(IsFolderPrefix(u"d:\\data\\", u"D:\\DATA\\a"));
    EXPECT_TRUE(IsFolderPrefix(u"/", u"/data"));
    EXPECT_FALSE(IsFolderPrefix(u"/data", u"/database"));
    EXPECT_FALSE(IsFolderPrefix(u"", u"/data"));
    EXPECT_EQ(WithoutTrailingSeparator(u"/data//"), u"/data/");
    EXPECT_EQ(WithoutTrailingSeparator(u"/"), u"/");
    EXPECT_EQ(LastComponent(u"C:/mixed\\last\\"), u"last");
}

} // namespace
} // namespace cv::vek::rovo::serverlibs
