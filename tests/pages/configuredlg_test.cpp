// The Search Areas page with real widgets on the reference store: what it
// shows, what reaches the editor, and what the store holds after a commit.

#include "pages/addsearchareadlg.h"
#include "pages/searchareamodel.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "searchareasfixture.h"
#include "sharedsource/toolbar.h"
#include "sorvik/wstringqt.h"
#include "support/tempdir.h"

#include <QLineEdit>
#include <QMessageBox>
#include <QTest>
#include <QToolButton>

#include <gtest/gtest.h>

namespace {

using namespace pagestest;
using pages::CConMenuCTreeCtrl;
using resources::FormatString;
using resources::LoadString;
using resources::Str;
using sharedsource::MessageResult;
using uitest::BoxLine;

const std::vector<Folder> kThreeAreas = {
    {u"/data/A", u"/data/A", u"Alpha"},    {u"/data/A/zeta", u"", u"zeta", true},
    {u"/data/A/Beta", u"", u"Beta", true}, {u"/data/A/alpha", u"", u"alpha", true},
    {u"/data/B", u"/data/B", u"Bravo"},    {u"/other", u"/mnt/other", u"Other"},
};

std::string InputError(Str text, const QString &argument)
{
    return BoxLine(LoadString(Str::IncorrectParameter), FormatString(text, argument), "error", "ok");
}

class SearchAreas : public SearchAreasPage
{
protected:
    // Renames item in place as a user does: F2, the new text, then key.
    void Rename(QTreeWidgetItem *item, const QString &text, Qt::Key key = Qt::Key_Return)
    {
        Select(item);
        QTest::keyClick(&Tree(), Qt::Key_F2);
        ASSERT_TRUE(Tree().IsEditingLabel());
        // The label editor itself: the window may not hold the focus on a busy machine.
        auto *field = uitest::LabelEditor(Tree());
        ASSERT_NE(field, nullptr);
        field->selectAll();
        QTest::keyClicks(field, text);
        QTest::keyClick(field, key);
        ASSERT_TRUE(QTest::qWaitFor([this] { return !Tree().IsEditingLabel(); }, 5000));
    }
};

TEST_F(SearchAreas, AnEmptyConfigurationShowsAnEmptyTreeWithOnlyAddEnabled)
{
    pages::CConfigureDlg &page = Open();
    EXPECT_EQ(Tree().topLevelItemCount(), 0);
    EXPECT_EQ(Buttons(), "10000");
    EXPECT_FALSE(page.LoadFailed());
    EXPECT_FALSE(page.SavePage());

    const sharedsource::ToToolBar &toolBar = *page.ToolBar();
    EXPECT_EQ(toolBar.ButtonCount(), 5);
    using namespace resources;
    EXPECT_EQ(toolBar.Button(ID_ADD_SEARCH_AREA)->toolTip(), LoadString(Str::AddSearchAreaTool));
    EXPECT_EQ(toolBar.Button(ID_EXCLUDE_SUBFOLDER)->toolTip(), LoadString(Str::ExcludeSubfolderTool));
    EXPECT_EQ(toolBar.Button(ID_REMOVE_SEARCH_AREA)->toolTip(), LoadString(Str::RemoveTool));
    EXPECT_EQ(toolBar.Button(ID_SEARCH_AREA_UP)->toolTip(), LoadString(Str::UpTool));
    EXPECT_EQ(toolBar.Button(ID_SEARCH_AREA_DOWN)->toolTip(), LoadString(Str::DownTool));
    EXPECT_EQ(Tree().iconSize(), QSize(16, 16)) << "small icons at 96 dots per inch";
}

TEST_F(SearchAreas, LoadShowsAreasInOrderAndExclusionsSortedIgnoringCase)
{
    Open(kThreeAreas);
    EXPECT_EQ(TreeLines(), (Lines{"Alpha", "  alpha", "  Beta", "  zeta", "Bravo", "Other"}));
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(CConMenuCTreeCtrl::Position(*Area(i)), i);
    EXPECT_EQ(m_page->SearchAreas()[2].clientPath, QStringLiteral("/mnt/other"));

    Select(Area(0));
    EXPECT_EQ(Buttons(), "11101") << "the first area";
    Select(Area(1));
    EXPECT_EQ(Buttons(), "11111");
    Select(Area(2));
    EXPECT_EQ(Buttons(), "11110") << "the last area";
    Select(Child(0, 1));
    EXPECT_EQ(Buttons(), "11100") << "an excluded folder";
    Select(nullptr);
    EXPECT_EQ(Buttons(), "10000");
}

TEST_F(SearchAreas, RelativeNamesOfExcludedFolders)
{
    EXPECT_EQ(pages::RelativeName(QStringLiteral("C:\\Data\\Old\\"), QStringLiteral("C:\\Data")), QStringLiteral("Old"))
        << "a folder stored with a trailing separator";
    EXPECT_EQ(pages::RelativeName(QStringLiteral("/data/a/b/"), QStringLiteral("/data")), QStringLiteral("a/b"));
    EXPECT_EQ(pages::RelativeName(QStringLiteral("/x"), QStringLiteral("/data/long")), QString())
        << "never beyond the end";
}

TEST_F(SearchAreas, ALoadFailureAnswersLoadFailedAndTheTreeFollowsTheList)
{
    pages::CConfigureDlg &page = Open(kThreeAreas);
    Select(Area(2));
    m_log->failures["ListExcludedFolders"] = cv::rovo::status::StoreUnavailable;
    EXPECT_EQ(page.Reload(), pages::kLoadFailed);
    EXPECT_EQ(Tree().topLevelItemCount(), int(page.SearchAreas().size()));
    EXPECT_EQ(Buttons(), "10000");
    QTest::keyClick(&Tree(), Qt::Key_Delete);
    EXPECT_TRUE(m_prompts.shown.empty());

    m_log->failures.clear();
    EXPECT_EQ(page.Reload(), 0);
    EXPECT_EQ(Tree().topLevelItemCount(), 3);
}

TEST_F(SearchAreas, QuestionsOfTheAddDialogAreAnsweredFromThePage)
{
    pages::CConfigureDlg &page = Open(kThreeAreas);
    IInputTester &tester = page.InputTester();
    const auto clientTest = [&tester](const char16_t *path) {
        cv::krn::WString name(u"untouched");
        const int result = tester.TestClientPath(cv::krn::WString(path), name);
        return std::to_string(result) + " " + testsupport::Narrow(name.view());
    };
    EXPECT_EQ(clientTest(u"/DATA/b"), "1 Bravo") << "the same folder, case ignored";
    EXPECT_EQ(clientTest(u"/data/A/x"), "2 Alpha");
    EXPECT_EQ(clientTest(u"/mnt"), "-1 Other") << "by client path";
    EXPECT_EQ(clientTest(u"/data/Alpha"), "0 untouched") << "a longer name is no folder below";
    cv::krn::WString name;
    EXPECT_EQ(tester.TestPath(cv::krn::WString(u"/other/x"), name), 2);
    EXPECT_EQ(tester.TestPath(cv::krn::WString(u"/mnt/other"), name), 0) << "by server path";

    EXPECT_TRUE(tester.IsAliasInUse(cv::krn::WString(u"bRAVO")));
    EXPECT_FALSE(tester.IsAliasInUse(cv::krn::WString(u"Bravo2")));
    EXPECT_EQ(tester.CheckPathAllowed(cv::krn::WString(u"/new"), cv::krn::WString(u"/cnew"), cv::krn::WString(u"N")),
              0);
    m_log->failures["CheckAreaAllowed"] = cv::rovo::status::StoreUnavailable;
    EXPECT_EQ(tester.CheckPathAllowed(cv::krn::WString(u"/new"), cv::krn::WString(u"/cnew"), cv::krn::WString(u"N")), 0)
        << "a failed question allows; the commit checks again";
    EXPECT_EQ(m_log->Only({"CheckAreaAllowed"}),
              (Lines{"CheckAreaAllowed /new | /cnew | N", "CheckAreaAllowed /new | /cnew | N"}));
}

TEST_F(SearchAreas, AddingAFolderAbsorbsTheSearchAreasInsideIt)
{
    pages::CConfigureDlg &page = Open({{u"/data/A", u"/data/A", u"A"},
                                       {u"/data/A/Tmp", u"", u"Tmp", true},
                                       {u"/data/B", u"/data/B", u"B"},
                                       {u"/other", u"/other", u"Other"}});
    page.InsertSearchArea(QStringLiteral("/data/"), QStringLiteral("Data"), QStringLiteral("/data/"));
    EXPECT_EQ(EditorCalls(), (Lines{"AddFolder /data | /data | Data | 1 | 0", "RemoveFolder /data/A | 1",
                                    "AddFolder /data/A/Tmp |  | A/Tmp | 0 | 1", "RemoveFolder /data/B | 1"}));
    EXPECT_EQ(TreeLines(), (Lines{"Other", "Data", "  A/Tmp"}));
    EXPECT_EQ(CConMenuCTreeCtrl::Position(*Area(1)), 1);
    EXPECT_EQ(Tree().SelectedItem(), Area(1));
    EXPECT_EQ(Buttons(), "11110");
    ASSERT_NE(page.SearchAreas()[1].excluded.Find(u"a/tmp"), nullptr);
    EXPECT_EQ(*page.SearchAreas()[1].excluded.Find(u"a/tmp"), QStringLiteral("/data/A/Tmp")) << "case ignored";

    Commit();
    EXPECT_EQ(Snapshot(), (Lines{"/other | /other | Other", "/data | /data | Data", "  /data/A/Tmp | A/Tmp"}));
}

// Where server and client paths of the search areas differ, each absorbed
// area's excluded folders keep their place below the path that matched.
TEST_F(SearchAreas, AbsorbedExclusionsArePlacedByThePathThatMatched)
{
    pages::CConfigureDlg &page = Open({{u"/srv/data/A", u"/home/u/A", u"A"},
                                       {u"/srv/data/A/Tmp", u"", u"Tmp", true},
                                       {u"/elsewhere/B", u"/mnt/share/B", u"B"},
                                       {u"/elsewhere/B/Old", u"", u"Old", true}});
    page.InsertSearchArea(QStringLiteral("/srv/data"), QStringLiteral("Data"), QStringLiteral("/mnt/share"));
    EXPECT_EQ(EditorCalls(), (Lines{"AddFolder /srv/data | /mnt/share | Data | 1 | 0", "RemoveFolder /srv/data/A | 1",
                                    "AddFolder /srv/data/A/Tmp |  | A/Tmp | 0 | 1", "RemoveFolder /elsewhere/B | 1",
                                    "AddFolder /srv/data/B/Old |  | B/Old | 0 | 1"}));
    EXPECT_EQ(TreeLines(), (Lines{"Data", "  A/Tmp", "  B/Old"}));
    Commit();
    EXPECT_EQ(Snapshot(),
              (Lines{"/srv/data | /mnt/share | Data", "  /srv/data/A/Tmp | A/Tmp", "  /srv/data/B/Old | B/Old"}));
}

TEST_F(SearchAreas, RemovingAsksForSearchAreasOnly)
{
    pages::CConfigureDlg &page = Open(kThreeAreas);
    const auto question = [](const char *name) {
        return BoxLine(LoadString(Str::Warning), FormatString(Str::RemoveSearchAreaQuestion, QString::fromLatin1(name)),
                       "warning", "ok-cancel");
    };
    Select(Area(0));
    m_prompts.answers = {MessageResult::Cancel};
    QTest::keyClick(&Tree(), Qt::Key_Delete);
    EXPECT_EQ(Tree().topLevelItemCount(), 3);
    EXPECT_FALSE(page.IsModified());

    Select(Child(0, 1));
    page.OnCommand(resources::ID_REMOVE_SEARCH_AREA);
    EXPECT_EQ(TreeLines(), (Lines{"Alpha", "  alpha", "  zeta", "Bravo", "Other"}));
    EXPECT_EQ(m_prompts.shown.size(), 1u) << "an excluded folder goes without a question";
    for (int area : {0, 1, 0}) {
        Select(Area(area));
        page.OnCommand(resources::ID_REMOVE_SEARCH_AREA);
        if (area == 0 && Tree().topLevelItemCount() == 2) {
            EXPECT_EQ(CConMenuCTreeCtrl::Position(*Area(1)), 1) << "renumbered";
        }
    }
    EXPECT_EQ(m_prompts.Lines(), (Lines{question("Alpha"), question("Alpha"), question("Other"), question("Bravo")}));
    EXPECT_EQ(Tree().topLevelItemCount(), 0);
    EXPECT_EQ(Buttons(), "10000");
    EXPECT_TRUE(page.IsModified());
    EXPECT_EQ(EditorCalls(), (Lines{"RemoveFolder /data/A/Beta | 1", "RemoveFolder /data/A | 1",
                                    "RemoveFolder /other | 1", "RemoveFolder /data/B | 1"}));
    Commit();
    EXPECT_TRUE(Snapshot().empty());
}

TEST_F(SearchAreas, ReorderingWritesTheWholeOrderOnceWhenSaved)
{
    pages::CConfigureDlg &page = Open(kThreeAreas);
    Select(Area(0));
    page.OnCommand(resources::ID_SEARCH_AREA_UP);
    Select(Area(2));
    page.OnCommand(resources::ID_SEARCH_AREA_DOWN);
    EXPECT_FALSE(page.SavePage()) << "up on the first and down on the last change nothing";
    EXPECT_EQ(TreeLines()[0], "Alpha");

    Area(0)->setExpanded(true);
    Select(Area(0));
    page.OnCommand(resources::ID_SEARCH_AREA_DOWN);
    page.OnCommand(resources::ID_SEARCH_AREA_DOWN);
    EXPECT_EQ(TreeLines(), (Lines{"Bravo", "Other", "Alpha", "  alpha", "  Beta", "  zeta"}));
    EXPECT_EQ(Tree().SelectedItem(), Area(2)) << "the moved area stays selected";
    EXPECT_TRUE(Area(2)->isExpanded());
    EXPECT_EQ(Buttons(), "11110");
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(CConMenuCTreeCtrl::Position(*Area(i)), i);
    EXPECT_TRUE(EditorCalls().empty()) << "the order waits for the save";

    EXPECT_TRUE(page.SavePage());
    EXPECT_EQ(EditorCalls(), Lines{"SetSearchAreaOrder /data/B,/other,/data/A"});
    Commit();
    EXPECT_EQ(Snapshot(),
              (Lines{"/data/B | /data/B | Bravo", "/other | /mnt/other | Other", "/data/A | /data/A | Alpha",
                     "  /data/A/zeta | zeta", "  /data/A/Beta | Beta", "  /data/A/alpha | alpha"}));
}

TEST_F(SearchAreas, RenamesAreCheckedAgainstTheOtherNames)
{
    pages::CConfigureDlg &page = Open(kThreeAreas);
    Rename(Area(0), QStringLiteral("ALPHA"));
    EXPECT_EQ(Area(0)->text(0), QStringLiteral("Alpha")) << "the same name in other case is no change";
    Rename(Area(0), QStringLiteral("bravo"));
    EXPECT_EQ(m_prompts.Lines(), Lines{InputError(Str::NameExists, QStringLiteral("bravo"))});
    Rename(Area(0), QStringLiteral("   "));
    EXPECT_EQ(Area(0)->text(0), QStringLiteral("Alpha")) << "a search area keeps a name";
    EXPECT_FALSE(page.IsModified());
    EXPECT_TRUE(EditorCalls().empty());

    Rename(Area(0), QStringLiteral("First"));
    EXPECT_EQ(Area(0)->text(0), QStringLiteral("First"));
    EXPECT_EQ(page.SearchAreas()[0].name, QStringLiteral("First"));
    EXPECT_TRUE(page.IsModified());
    EXPECT_EQ(EditorCalls(), Lines{"UpdateFolder /data/A | /data/A | First"});
    EXPECT_TRUE(page.InputTester().IsAliasInUse(cv::krn::WString(u"first")));

    Select(Child(0, 0));
    QTest::keyClick(&Tree(), Qt::Key_F2);
    EXPECT_FALSE(Tree().IsEditingLabel()) << "excluded folders cannot be renamed";
    EXPECT_TRUE(m_host->isVisible());
}

// Enter and Escape reach the dialog's buttons from the page, except while a
// search area is renamed.
TEST_F(SearchAreas, EnterAndEscapeEndARenameButCloseTheDialogOtherwise)
{
    Open(kThreeAreas);
    Rename(Area(1), QStringLiteral("Other name"), Qt::Key_Escape);
    EXPECT_EQ(Area(1)->text(0), QStringLiteral("Bravo"));
    Rename(Area(1), QStringLiteral("B2"), Qt::Key_Enter);
    EXPECT_EQ(Area(1)->text(0), QStringLiteral("B2"));
    EXPECT_TRUE(m_host->isVisible()) << "the rename kept both keys";

    QTest::keyClick(&Tree(), Qt::Key_Escape);
    EXPECT_FALSE(m_host->isVisible());
    EXPECT_EQ(m_host->result(), sharedsource::kResultCancel);
    m_host->show();
    Select(Area(0));
    QTest::keyClick(&Tree(), Qt::Key_Return);
    EXPECT_FALSE(m_host->isVisible());
    EXPECT_EQ(m_host->result(), sharedsource::kResultOk);
}

// A real message box opened while the rename field loses the focus to it.
TEST_F(SearchAreas, ADuplicateNameIsRefusedWithARealMessageBox)
{
    Open(kThreeAreas, false);
    uitest::ModalPoller poller;
    poller.Expect("the duplicate-name box", uitest::Is<QMessageBox>(), [](QWidget &w) {
        auto &box = static_cast<QMessageBox &>(w);
        EXPECT_EQ(box.windowTitle(), LoadString(Str::IncorrectParameter));
        EXPECT_EQ(box.text(), FormatString(Str::NameExists, QStringLiteral("Other")));
        box.button(QMessageBox::Ok)->click();
    });
    Rename(Area(0), QStringLiteral("Other"));
    EXPECT_TRUE(poller.Done());
    EXPECT_EQ(poller.Acted(), 1) << "one box, however the focus moved";
    EXPECT_EQ(Area(0)->text(0), QStringLiteral("Alpha"));
    EXPECT_TRUE(EditorCalls().empty());
}

TEST_F(SearchAreas, EditorFailuresAreSwallowedAndThePageKeepsTheChange)
{
    pages::CConfigureDlg &page = Open(kThreeAreas);
    for (const char *operation : {"AddFolder", "RemoveFolder", "UpdateFolder", "SetSearchAreaOrder"})
        m_log->failures[operation] = cv::rovo::status::Conflict;

    page.InsertSearchArea(QStringLiteral("/data"), QStringLiteral("Data"), QStringLiteral("/data"));
    EXPECT_EQ(TreeLines(), (Lines{"Other", "Data", "  A/alpha", "  A/Beta", "  A/zeta"}));
    Rename(Area(1), QStringLiteral("All data"));
    EXPECT_EQ(page.SearchAreas()[1].name, QStringLiteral("All data"));
    Select(Area(0));
    page.OnCommand(resources::ID_SEARCH_AREA_DOWN);
    EXPECT_FALSE(page.SavePage()) << "the order could not be written";
    Select(Area(0));
    page.OnCommand(resources::ID_REMOVE_SEARCH_AREA);
    EXPECT_EQ(TreeLines(), Lines{"Other"});
    EXPECT_EQ(m_log->Count("SetSearchAreaOrder"), 1);
}

// The add command runs the Add Search Area dialog modally on the page's
// questions and prompts; the area is inserted with what it returned.
TEST_F(SearchAreas, TheAddCommandRunsTheAddDialogOnThePage)
{
    testsupport::TempDir folder;
    const QString root = QString::fromStdString(folder.path().string());
    pages::CConfigureDlg &page = Open();
    page.InsertSearchArea(root + QStringLiteral("/inner"), QStringLiteral("Inner"), root + QStringLiteral("/inner"));
    m_prompts.answers = {MessageResult::Ok};

    uitest::ModalPoller poller;
    poller.Expect("the add dialog", uitest::Is<pages::CAddSearchAreaDlg>(), [&root, &page](QWidget &w) {
        EXPECT_EQ(w.windowTitle(), LoadString(Str::AddSearchAreaTitle));
        EXPECT_EQ(w.parentWidget(), &page);
        sharedsource::GetControl<QLineEdit>(&w, resources::IDC_ALIAS).setText(QStringLiteral("Everything"));
        sharedsource::GetControl<QLineEdit>(&w, resources::IDC_PATH).setText(root + u'/');
        QTest::keyClick(&w, Qt::Key_Return);
    });
    QTest::mouseClick(page.ToolBar()->Button(resources::ID_ADD_SEARCH_AREA), Qt::LeftButton);
    EXPECT_TRUE(poller.Done());
    EXPECT_EQ(m_prompts.Lines(), Lines{BoxLine(LoadString(Str::Information), LoadString(Str::PathContainsSearchAreas),
                                               "information", "ok-cancel")})
        << "the area added in this session counts";
    EXPECT_EQ(TreeLines(), Lines{"Everything"});
    EXPECT_EQ(page.SearchAreas()[0].path, root);
    EXPECT_EQ(m_log->Only({"AddFolder"}).back(),
              "AddFolder " + root.toStdString() + " | " + root.toStdString() + " | Everything | 1 | 0");
}

TEST_F(SearchAreas, LayoutStretchesTheTreeAndKeepsTheToolbarAtTheRight)
{
    pages::CConfigureDlg &page = Open();
    const QRect placeholder = sharedsource::GetControl<QWidget>(&page, resources::IDC_SEARCH_AREAS_TOOLBAR).geometry();
    const QRect toolBar = page.ToolBar()->geometry();
    EXPECT_EQ(toolBar.x() + toolBar.width(), placeholder.x() + placeholder.width() + 4);
    EXPECT_EQ(toolBar.y() + toolBar.height(), placeholder.y() + placeholder.height());

    using namespace resources;
    uitest::ExpectLayout(page, QSize(100, 50),
                         {{IDC_SEARCH_AREA_TREE, 0, 0, 100, 50}, {IDC_SEARCH_AREAS_TOOLBAR, 100, 0, 100, 0}});
    EXPECT_EQ(page.ToolBar()->geometry(), toolBar.translated(100, 0));
}

} // namespace
