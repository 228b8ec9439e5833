#include "krn/osdep/inifile.h"
#include "krn/osdep/registry.h"

#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <fstream>

namespace cv::krn::osdep {
namespace {

class KrnRegistry : public ::testing::Test
{
protected:
    void WriteRegistry(const std::string &content)
    {
        std::ofstream(m_file, std::ios::binary) << content;
    }

    std::u16string Read(std::u16string_view key, std::u16string_view value, RegistryView view = RegistryView::Default)
    {
        return ReadRegistryString(RegistryHive::LocalMachine, key, value, u"<default>", view);
    }

    testsupport::TempDir m_dir;
    std::filesystem::path m_file = m_dir.file("registry.ini");
    testsupport::ScopedEnv m_env{"CORVANE_REGISTRY", m_file.string()};
};

TEST_F(KrnRegistry, FindsValuesWhateverTheCaseOfKeyAndName)
{
    WriteRegistry("[Software\\Corvane\\Common\\Sorvik]\r\n"
                  "binDir=/opt/corvane/lib\r\n"
                  "[Software\\Corvane\\Common\\SorvikDesktop]\n"
                  "binDir = C:\\Program Files\\Sorvik\\ \n");
    EXPECT_EQ(Read(u"Software\\Corvane\\Common\\Sorvik", u"binDir"), u"/opt/corvane/lib");
    EXPECT_EQ(Read(u"SOFTWARE\\corvane\\COMMON\\sorvik", u"BINDIR"), u"/opt/corvane/lib");
    EXPECT_EQ(Read(u"Software\\Corvane\\Common\\SorvikDesktop", u"bindir", RegistryView::Bits32),
              u"C:\\Program Files\\Sorvik\\");
}

TEST_F(KrnRegistry, MissingFileKeyOrValueGivesTheDefault)
{
    EXPECT_EQ(Read(u"Software\\Corvane\\Common\\Sorvik", u"binDir"), u"<default>");
    WriteRegistry("[Software\\Corvane\\Common\\Sorvik]\nbinDir=/opt\n");
    EXPECT_EQ(Read(u"Software\\Corvane\\Common\\Sorvik\\ConfigItems", u"rovoCommDllClient"), u"<default>");
    EXPECT_EQ(Read(u"Software\\Corvane\\Common\\Sorvik", u"other"), u"<default>");
    EXPECT_EQ(Read(u"Software\\Corvane\\Common", u"binDir"), u"<default>");
    EXPECT_EQ(ReadRegistryString(RegistryHive::LocalMachine, u"Nowhere", u"x"), u"");
}

TEST_F(KrnRegistry, SkipsBrokenLinesAndComments)
{
    WriteRegistry("\xEF\xBB\xBF"
                  "orphan=before any section\n"
                  "[Good]\n"
                  "; comment=1\n"
                  "# hash=2\n"
                  "this line has no equals sign\n"
                  "=value of the key itself\n"
                  "path=C:\\a;b # not a comment\n"
                  "path=second one loses\n"
                  "[Broken\n"
                  "leak=must not land in Good\n"
                  "[Good]\n"
                  "late=merged\n"
                  "name=Gr\xC3\xBC\xC3\x9F" "e\n"
                  "\xFF\xFE=odd bytes\n"
                  "[]\n"
                  "empty=section\n");
    EXPECT_EQ(Read(u"Good", u"path"), u"C:\\a;b # not a comment");
    EXPECT_EQ(Read(u"Good", u"late"), u"merged");
    EXPECT_EQ(Read(u"Good", u"name"), u"Gr\u00FC\u00DF" u"e");
    EXPECT_EQ(Read(u"Good", u""), u"value of the key itself");
    EXPECT_EQ(Read(u"Good", u"leak"), u"<default>");
    EXPECT_EQ(Read(u"Good", u"comment"), u"<default>");
    EXPECT_EQ(Read(u"Good", u"orphan"), u"<default>");
    EXPECT_EQ(Read(u"Broken", u"leak"), u"<default>");
    EXPECT_EQ(Read(u"", u"empty"), u"section");
}

TEST_F(KrnRegistry, ReadsAFolderInsteadOfAFileAsEmpty)
{
    testsupport::ScopedEnv env("CORVANE_REGISTRY", m_dir.path().string());
    EXPECT_EQ(Read(u"Good", u"x"), u"<default>");
}

TEST(KrnIniFile, UnsignedValuesAreStrict)
{
    const IniFile ini = IniFile::Parse("[Shared]\nA= 15 \nB=-3\nC=12abc\nD=4294967296\nE=\nF=4294967295\n");
    EXPECT_EQ(ini.UnsignedValue(u"shared", u"a"), 15u);
    EXPECT_EQ(ini.UnsignedValue(u"Shared", u"F"), 4294967295u);
    for (const char16_t *name : {u"B", u"C", u"D", u"E", u"missing"})
        EXPECT_FALSE(ini.UnsignedValue(u"Shared", name).has_value());
}

} // namespace
} // namespace cv::krn::osdep
