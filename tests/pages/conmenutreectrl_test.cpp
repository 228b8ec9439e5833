// The Search Areas tree: its context menu (entries, states, placement),
// info tips, and the commands reached through it: exclude and explore.

#include "pages/conmenutreectrl.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "searchareasfixture.h"
#include "support/scopedenv.h"
#include "support/tempdir.h"

#include <QContextMenuEvent>
#include <QFile>
#include <QHelpEvent>
#include <QLineEdit>
#include <QTest>
#include <QToolTip>

#include <gtest/gtest.h>

#include <fstream>

namespace {

using namespace pagestest;
using pages::CConMenuCTreeCtrl;
using resources::FormatString;
using resources::LoadString;
using resources::Str;
using uitest::BoxLine;

const std::vector<Folder> kAreas = {
    {u"/data/A", u"/client/A", u"Alpha"},
    {u"/data/A/Tmp", u"", u"Tmp", true},
    {u"/data/B", u"/client/B", u"Bravo"},
    {u"/data/C", u"/client/C", u"Charlie"},
};

// The entries of the menu with the states given as 1 (on) or 0, in menu order.
std::vector<std::string> Entries(const char *states)
{
    const Str texts[] = {Str::AddSearchAreaMenu, Str::ExcludeSubfolderMenu, Str::RemoveMenu, Str::UpMenu,
                         Str::DownMenu,          Str::RenameMenu,           Str::ExploreMenu};
    std::vector<std::string> entries;
    for (int i = 0; i < 7; ++i) {
        if (i == 5 || i == 6)
            entries.push_back("-");
        entries.push_back(LoadString(texts[i]).toStdString() + (states[i] == '1' ? "" : " (off)"));
    }
    return entries;
}

class SearchAreaTree : public SearchAreasPage
{
protected:
    MenuSeen MenuByKey(Qt::Key key = Qt::Key_Menu, Qt::KeyboardModifiers modifiers = Qt::NoModifier,
                       const QString &choose = {})
    {
        return WithMenu([&] { QTest::keyClick(&Tree(), key, modifiers); }, choose);
    }
    MenuSeen MenuByMouse(const QPoint &at, const QString &choose = {})
    {
        QWidget *viewport = Tree().viewport();
        return WithMenu(
            [&] {
                QContextMenuEvent event(QContextMenuEvent::Mouse, at, viewport->mapToGlobal(at));
                QApplication::sendEvent(viewport, &event);
            },
            choose);
    }
    QPoint Center(QTreeWidgetItem *item) { return Tree().visualItemRect(item).center(); }
    QString TipAt(const QPoint &at)
    {
        QHelpEvent event(QEvent::ToolTip, at, Tree().viewport()->mapToGlobal(at));
        QApplication::sendEvent(Tree().viewport(), &event);
        return QToolTip::isVisible() ? QToolTip::text() : QString();
    }
};

TEST_F(SearchAreaTree, MenuStatesFollowTheSelection)
{
    Open(kAreas);
    Select(Area(0));
    EXPECT_EQ(MenuByKey().entries, Entries("1110111")) << "the first area";
    Select(Area(1));
    EXPECT_EQ(MenuByKey().entries, Entries("1111111"));
    Select(Area(2));
    EXPECT_EQ(MenuByKey().entries, Entries("1111011")) << "the last area";
    Select(Child(0, 0));
    EXPECT_EQ(MenuByKey().entries, Entries("1110001")) << "an excluded folder";

    const QPoint below(5, Tree().viewport()->height() - 5);
    ASSERT_EQ(Tree().itemAt(below), nullptr);
    EXPECT_EQ(MenuByMouse(below).entries, Entries("1000000")) << "empty space";
    EXPECT_EQ(Tree().SelectedItem(), nullptr) << "the right click cleared the selection";
    EXPECT_EQ(Buttons(), "10000");
}

TEST_F(SearchAreaTree, OnTheOnlyAreaNeitherUpNorDown)
{
    Open({{u"/data/A", u"/data/A", u"Alpha"}});
    EXPECT_EQ(MenuByMouse(Center(Area(0))).entries, Entries("1110011"));
    EXPECT_EQ(Tree().SelectedItem(), Area(0)) << "the right click selected the area";
    EXPECT_EQ(Buttons(), "11100");
}

TEST_F(SearchAreaTree, MenuPlacementForMouseAndKeyboard)
{
    Open(kAreas);
    const QPoint at = Center(Area(1)) + QPoint(3, 1);
    EXPECT_EQ(MenuByMouse(at).position, Tree().viewport()->mapToGlobal(at)) << "at the cursor";

    Select(Area(2));
    const QRect row = Tree().visualItemRect(Area(2));
    const QPoint corner = Tree().viewport()->mapFromGlobal(MenuByKey().position);
    EXPECT_EQ(corner.y(), row.bottom() + 1) << "below the item";
    EXPECT_GE(corner.x(), row.left() + Tree().iconSize().width()) << "where its text starts";
    EXPECT_LT(corner.x(), row.center().x());
    EXPECT_EQ(MenuByKey(Qt::Key_F10, Qt::ShiftModifier).position, Tree().viewport()->mapToGlobal(corner));

    Select(nullptr);
    EXPECT_EQ(MenuByKey(Qt::Key_F10, Qt::ShiftModifier).position, Tree().mapToGlobal(QPoint(0, 0)))
        << "without a selection: the tree's upper left corner";
    EXPECT_EQ(MenuByKey().position, Tree().mapToGlobal(QPoint(0, 0)));
}

TEST_F(SearchAreaTree, ChosenEntriesReachThePage)
{
    Open(kAreas);
    MenuByMouse(Center(Area(0)), LoadString(Str::DownMenu));
    EXPECT_EQ(Area(1)->text(0), QStringLiteral("Alpha"));
    MenuByKey(Qt::Key_Menu, Qt::NoModifier, LoadString(Str::RenameMenu));
    EXPECT_TRUE(Tree().IsEditingLabel());
    auto *editor = uitest::LabelEditor(Tree());
    ASSERT_NE(editor, nullptr) << "the label editor";
    QTest::keyClick(editor, Qt::Key_Escape);
    EXPECT_FALSE(Tree().IsEditingLabel());
    EXPECT_TRUE(m_host->isVisible());

    // Without a page around it the tree has nobody to hand its commands to.
    CConMenuCTreeCtrl alone(nullptr);
    alone.addTopLevelItem(CConMenuCTreeCtrl::NewSearchAreaItem(QStringLiteral("x"), QIcon(), 0));
    alone.Select(alone.topLevelItem(0));
    QTest::keyClick(&alone, Qt::Key_Delete);
    QTest::keyClick(&alone, Qt::Key_F2);
    EXPECT_EQ(alone.topLevelItemCount(), 1);
    EXPECT_TRUE(alone.InfoTipAt(QPoint(1, 1)).isEmpty());
}

TEST_F(SearchAreaTree, InfoTipsShowThePaths)
{
    Open(kAreas);
    Area(0)->setExpanded(true);
    EXPECT_EQ(TipAt(Center(Area(0))), QStringLiteral("/data/A")) << "the path, not the client path";
    EXPECT_EQ(TipAt(Center(Child(0, 0))), QStringLiteral("/data/A/Tmp"));
    EXPECT_EQ(Tree().InfoTipAt(QPoint(5, Tree().viewport()->height() - 5)), QString()) << "empty space";
}

TEST_F(SearchAreaTree, ExcludingASubfolder)
{
    pages::CConfigureDlg &page = Open(kAreas);
    const auto exclude = [&](QTreeWidgetItem *item, const QString &folder) {
        Select(item);
        m_prompts.folders = {folder};
        page.OnCommand(resources::ID_EXCLUDE_SUBFOLDER);
    };
    exclude(Child(0, 0), QStringLiteral("/data/A"));
    exclude(Area(0), QStringLiteral("/DATA/A/"));
    exclude(Area(0), QStringLiteral("/data/a/tmp"));
    exclude(Area(0), QStringLiteral("/data/Alpha"));
    const std::string browse = LoadString(Str::SelectFolderToExclude).toStdString() + " | /data/A | ";
    EXPECT_EQ(m_prompts.BrowseLines(), (Lines{browse, browse, browse, browse})) << "rooted at the search area";
    const std::string ownFolder =
        BoxLine(LoadString(Str::ServerError), LoadString(Str::CannotExcludeSearchArea), "error", "ok");
    EXPECT_EQ(m_prompts.Lines(),
              (Lines{ownFolder, ownFolder,
                     BoxLine(LoadString(Str::IncorrectParameter),
                             FormatString(Str::FolderAlreadyExcluded, QStringLiteral("/data/a/tmp")), "error", "ok"),
                     BoxLine(LoadString(Str::IncorrectParameter),
                             FormatString(Str::FolderOutsideSearchArea,
                                          {QStringLiteral("/data/Alpha"), QStringLiteral("Alpha")}),
                             "error", "ok")}));
    EXPECT_TRUE(EditorCalls().empty());
    EXPECT_FALSE(page.IsModified());

    exclude(Area(0), QStringLiteral("/data/A/Tmp/deeper/"));
    exclude(Area(0), QStringLiteral("/data/A/new"));
    exclude(Area(0), QStringLiteral("/data/A/Me"));
    EXPECT_EQ(EditorCalls(), (Lines{"AddFolder /data/A/Tmp/deeper |  | Tmp/deeper | 0 | 1",
                                    "AddFolder /data/A/new |  | new | 0 | 1", "AddFolder /data/A/Me |  | Me | 0 | 1"}));
    EXPECT_EQ(TreeLines(), (Lines{"Alpha", "  Me", "  new", "  Tmp", "  Tmp/deeper", "Bravo", "Charlie"}))
        << "in sorted place, case ignored";
    EXPECT_EQ(Tree().SelectedItem(), Child(0, 0));
    EXPECT_TRUE(page.IsModified());

    m_log->failures["AddFolder"] = cv::rovo::status::InvalidArgument;
    exclude(Area(2), QStringLiteral("/data/C/x"));
    EXPECT_EQ(Area(2)->childCount(), 0) << "what the editor refused is not shown";

    Commit();
    EXPECT_EQ(Snapshot(), (Lines{"/data/A | /client/A | Alpha", "  /data/A/Tmp | Tmp",
                                 "  /data/A/Tmp/deeper | Tmp/deeper", "  /data/A/new | new", "  /data/A/Me | Me",
                                 "/data/B | /client/B | Bravo", "/data/C | /client/C | Charlie"}));
}

TEST_F(SearchAreaTree, ExploreOpensTheFolderOrSaysWhyNot)
{
    pages::CConfigureDlg &page = Open(kAreas);
    std::vector<QStringList> started;
    bool starts = true;
    page.SetProcessStarter([&](const QString &program, const QStringList &arguments) {
        started.push_back(QStringList{program} + arguments);
        return starts;
    });
    Select(Area(0));
    page.OnCommand(resources::ID_EXPLORE_FOLDER);
    Area(0)->setExpanded(true);
    MenuByMouse(Center(Child(0, 0)), LoadString(Str::ExploreMenu));
    EXPECT_EQ(started, (std::vector<QStringList>{{QStringLiteral("xdg-open"), QStringLiteral("/client/A")},
                                                 {QStringLiteral("xdg-open"), QStringLiteral("/data/A/Tmp")}}))
        << "a search area by its client path, an excluded folder by its path";
    EXPECT_TRUE(m_prompts.shown.empty());

    starts = false;
    page.OnCommand(resources::ID_EXPLORE_FOLDER);
    EXPECT_EQ(m_prompts.Lines(),
              Lines{BoxLine(LoadString(Str::ServerError), LoadString(Str::ExploreError), "none", "ok")});
}

// The real start: xdg-open found along the search path gets the folder as
// one argument, blanks and all.
TEST_F(SearchAreaTree, ExploreStartsXdgOpenDetachedWithoutAShell)
{
    testsupport::TempDir bin;
    const std::string record = bin.file("arguments").string();
    {
        std::ofstream script(bin.file("xdg-open"));
        script << "#!/bin/sh\nprintf '%s\\n' \"$#\" \"$@\" > '" << record << ".part' && mv '" << record << ".part' '"
               << record << "'\n";
    }
    std::filesystem::permissions(bin.file("xdg-open"), std::filesystem::perms::owner_all);
    testsupport::ScopedEnv path("PATH", bin.path().string() + ":" + qgetenv("PATH").toStdString());

    Open({{u"/data/with blanks", u"/data/with blanks; $(touch x) 'q'", u"Blanks"}});
    Select(Area(0));
    m_page->OnCommand(resources::ID_EXPLORE_FOLDER);
    ASSERT_TRUE(QTest::qWaitFor([&] { return QFile::exists(QString::fromStdString(record)); }, 10000));
    std::ifstream written(record);
    std::string count, argument;
    std::getline(written, count);
    std::getline(written, argument);
    EXPECT_EQ(count, "1");
    EXPECT_EQ(argument, "/data/with blanks; $(touch x) 'q'");
    EXPECT_TRUE(m_prompts.shown.empty());
}

} // namespace
