#include "krn/osdep/pathjoin.h"

#include <gtest/gtest.h>

namespace cv::krn::osdep {
namespace {

TEST(KrnPathJoin, JoinsWithTheFoldersOwnSeparator)
{
    const struct
    {
        std::u16string_view folder, file, joined;
    } table[] = {
        {u"", u"Sorvik", u"Sorvik"},
        {u"/opt/corvane", u"Sorvik", u"/opt/corvane/Sorvik"},
        {u"/opt/corvane/", u"Sorvik", u"/opt/corvane/Sorvik"},
        {u"C:\\Program Files\\Sorvik", u"Sorvik.exe", u"C:\\Program Files\\Sorvik\\Sorvik.exe"},
        {u"C:\\Program Files\\Sorvik\\", u"Sorvik.exe", u"C:\\Program Files\\Sorvik\\Sorvik.exe"},
        {u"C:\\mixed/", u"x", u"C:\\mixed/x"},
        {u"bin", u"sub/tool", u"bin/sub/tool"},
        {u"/opt", u"/usr/bin/tool", u"/usr/bin/tool"},
        {u"/opt", u"\\\\server\\share\\x", u"\\\\server\\share\\x"},
        {u"/opt", u"d:\\tool.exe", u"d:\\tool.exe"},
        {u"/opt", u"1:tool", u"/opt/1:tool"},
        {u"/", u"etc", u"/etc"},
    };
    for (const auto &row : table)
        EXPECT_EQ(PathJoin(row.folder, row.file), row.joined);
    EXPECT_EQ(PathJoin(std::string_view("C:\\dir"), std::string_view("a.dll")), "C:\\dir\\a.dll");
}

} // namespace
} // namespace cv::krn::osdep
