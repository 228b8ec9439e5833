#include "referencesorvik.h"
#include "sorvik/vekexception.h"

namespace cv::vek::rovo::testing {
namespace {

class SearchAreaOperations : public ReferenceSorvik
{
protected:
    std::int32_t Add(std::u16string path, std::u16string clientPath, std::u16string alias = u"New")
    {
        m_ui.entered = {false, krn::WString(alias), krn::WString(path), krn::WString(clientPath)};
        krn::WString given(u"given by the host");
        return Service().AddSearchArea(given, 0);
    }
    std::int32_t Edit(std::u16string_view path, std::u16string newPath, std::u16string alias)
    {
        m_ui.entered = {true, krn::WString(alias), krn::WString(newPath), {}};
        krn::WString given(path);
        return Service().EditSearchArea(given, 0);
    }
};

TEST_F(SearchAreaOperations, NewAreaAbsorbsTheAreasInsideItWithTheirExclusions)
{
    Seed({{u"D:\\Data\\A", u"D:\\Data\\A", u"A"}, {u"D:\\Data\\A\\tmp", u"", u"tmp", true}, {u"D:\\Other", u"", u"O"}});
    EXPECT_EQ(Add(u"D:\\Data\\", u"D:\\Data\\", u"Data"), 1);
    EXPECT_EQ(Narrow(m_ui.shown.path), "given by the host");
    EXPECT_EQ(Snapshot(), (Lines{"D:\\Other |  | O", "D:\\Data | D:\\Data | Data", "  D:\\Data\\A\\tmp | A\\tmp"}));
}

TEST_F(SearchAreaOperations, AbsorbsByPathOrByClientPath)
{
    Seed({{u"/data/a", u"/data/a", u"a"},
          {u"/data/a/x", u"", u"x", true},
          {u"/srv/export/b", u"/data/b", u"b"}, // kept elsewhere, inside as the client sees it
          {u"/srv/export/b/y", u"", u"y", true},
          {u"/database", u"/database", u"db"},
          {u"/data2/sub", u"", u"n"}});
    EXPECT_EQ(Add(u"/data", u"/data"), 1);
    EXPECT_EQ(Add(u"/data2", u"", u"New2"), 1) << "two empty client paths do not make the same area";
    EXPECT_EQ(Snapshot(), (Lines{"/database | /database | db", "/data | /data | New", "  /data/a/x | a/x",
                                 "  /data/b/y | b/y", "/data2 |  | New2"}));
}

TEST_F(SearchAreaOperations, EditMovesTheAreaWithItsExclusionsAndKeepsTheNewAlias)
{
    Seed({{u"/data/a", u"/data/a", u"A"}, {u"/data/a/x", u"", u"x", true}});
    EXPECT_EQ(Edit(u"/data/a", u"/data/b/", u"B"), 1);
    EXPECT_EQ(Narrow(m_ui.shown.alias) + " " + Narrow(m_ui.shown.clientPath), "A /data/a");
    EXPECT_EQ(Edit(u"/data/b", u"/DATA/B", u"C"), 1) << "the same path: only the alias changes";
    EXPECT_EQ(Snapshot(), (Lines{"/data/b | /data/a | C", "  /data/b/x | x"}));

    m_ui.calls.clear();
    EXPECT_EQ(Edit(u"/data/b/x", u"/y", u"y"), CServerDialogs::kNotFound);
    EXPECT_TRUE(m_ui.calls.empty()) << "no dialog for a path that is no search area";
}

TEST_F(SearchAreaOperations, NothingChangesWithoutTheUsersOk)
{
    Seed({{u"/data", u"/data", u"Data"}, {u"/data/tmp", u"", u"tmp", true}});
    m_ui.dialogResult = kModalCancel;
    EXPECT_EQ(Add(u"/srv", u"/srv"), kModalCancel);
    m_ui.confirm = false;
    krn::WString path(u"/data/x");
    EXPECT_EQ(Service().ExcludeFolder(path), CServerDialogs::kDeclined);
    EXPECT_EQ(m_opened, 1) << "declining the exclusion contacts no server";
    path = u"/data";
    EXPECT_EQ(Service().RemoveSearchArea(path), CServerDialogs::kDeclined);
    path = u"/nowhere";
    EXPECT_EQ(Service().RemoveSearchArea(path), CServerDialogs::kNotFound);

    EXPECT_EQ(Snapshot(), (Lines{"/data | /data | Data", "  /data/tmp | tmp"}));
}

TEST_F(SearchAreaOperations, ExcludeAndRemoveAfterConfirmation)
{
    Seed({{u"/data", u"/data", u"Data"}, {u"/data/tmp", u"", u"tmp", true}, {u"/srv", u"", u"Srv"}});
    krn::WString path(u"/data/tmp");
    EXPECT_EQ(Service().RemoveSearchArea(path), 1);
    EXPECT_TRUE(m_ui.calls.empty()) << "an excluded folder goes without a question";
    path = u"/data/cache/";
    EXPECT_EQ(Service().ExcludeFolder(path), 1);
    path = u"/srv";
    EXPECT_EQ(Service().RemoveSearchArea(path), 1);
    EXPECT_EQ(m_ui.calls, (std::vector<std::string>{"confirm exclude", "confirm remove"}));
    EXPECT_EQ(Snapshot(), (Lines{"/data | /data | Data", "  /data/cache | cache"}));
}

TEST_F(SearchAreaOperations, LibraryFailuresPassToTheHostUnchanged)
{
    Seed({{u"/data", u"/data", u"Data"}});
    try {
        Add(u"/other", u"/other", u"data"); // the alias is taken: the commit fails
        ADD_FAILURE() << "no exception";
    } catch (const Exception &e) {
        EXPECT_EQ(e.Code(), cv::rovo::status::Conflict);
    }
    EXPECT_EQ(Snapshot(), (Lines{"/data | /data | Data"}));
}

} // namespace
} // namespace cv::vek::rovo::testing
