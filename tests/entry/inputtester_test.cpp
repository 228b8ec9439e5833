#include "entry/inputtester.h"
#include "referencesorvik.h"

#include <sqlite3.h>

namespace cv::vek::rovo::testing {
namespace {

TEST_F(ReferenceSorvik, InputTesterAnswersFromTheSearchAreas)
{
    Seed({{u"/data/a", u"/mnt/a", u"A"}, {u"/srv", u"/mnt/srv", u"Srv"}});
    const auto config = Open();
    CServerDialogsInputTester tester(config.view, config.editor);
    const auto test = [&](bool client, std::u16string_view path) {
        krn::WString alias(u"-");
        const std::int32_t result = client ? tester.TestClientPath(krn::WString(path), alias)
                                           : tester.TestPath(krn::WString(path), alias);
        return std::to_string(result) + " " + Narrow(alias);
    };
    EXPECT_EQ(test(false, u"/data/a"), "1 A");
    EXPECT_EQ(test(false, u"/DATA/A/sub"), "2 A");
    EXPECT_EQ(test(false, u"/"), "-1 A") << "the first area in order answers";
    EXPECT_EQ(test(false, u"/data/ab"), "0 -");
    EXPECT_EQ(test(true, u"/mnt/srv/x"), "2 Srv");
    EXPECT_EQ(test(true, u"/srv"), "0 -");
    EXPECT_TRUE(tester.IsAliasInUse(krn::WString(u"srv")));
    EXPECT_FALSE(tester.IsAliasInUse(krn::WString(u"Sr")));

    // Administrators keep the policy in the store itself.
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open((m_store.path() / "local.sorvikdb").c_str(), &db), SQLITE_OK);
    sqlite3_exec(db, "INSERT INTO area_policy(prefix) VALUES ('/etc')", nullptr, nullptr, nullptr);
    sqlite3_close(db);
    const krn::WString etc(u"/etc/x");
    EXPECT_EQ(tester.CheckPathAllowed(etc, etc, krn::WString(u"x")), 4) << "asked as a search area, not an exclusion";
    EXPECT_EQ(tester.CheckPathAllowed(krn::WString(u"/var"), krn::WString(u"/var"), krn::WString(u"v")), 0);
}

} // namespace
} // namespace cv::vek::rovo::testing
