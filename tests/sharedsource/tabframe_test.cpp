// A tabbed dialog as the properties dialog builds it: pages made from their
// templates inside a tab control that asks before the user leaves a page,
// Enter and Escape on pages that keep them or hand them to the dialog, and
// the host's font, help and prompts reaching pages and nested dialogs.

#include "scriptedprompts.h"
#include "sharedsource/basedlg.h"
#include "sharedsource/tabpagewnd.h"
#include "uitest.h"

#include <QLineEdit>
#include <QPushButton>
#include <QSignalSpy>
#include <QTabBar>
#include <QTest>
#include <QTreeWidget>

#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <memory>

namespace {

using namespace sharedsource;
using Lines = std::vector<std::string>;

constexpr int kTabs = 100, kPageEdit = 200, kPageTree = 201, kPagePlaceholder = 202;

DialogTemplate FrameTemplate()
{
    DialogTemplate t;
    t.id = 60020;
    t.title = QStringLiteral("Frame");
    t.size = QSize(260, 180);
    t.fontFace = QStringLiteral("DejaVu Sans");
    t.controls = {
        {kTabs, ControlKind::Custom, {}, QRect(5, 5, 250, 150)},
        {IDOK, ControlKind::DefaultButton, QStringLiteral("OK"), QRect(95, 160, 50, 14)},
        {IDCANCEL, ControlKind::Button, QStringLiteral("Cancel"), QRect(150, 160, 50, 14)},
        {IDHELP, ControlKind::Button, QStringLiteral("&Help"), QRect(205, 160, 50, 14)},
    };
    return t;
}

DialogTemplate PageTemplate()
{
    DialogTemplate t;
    t.id = 60021;
    t.size = QSize(240, 120);
    t.fontFace = QStringLiteral("DejaVu Sans Mono");
    t.pointSize = 14;
    t.controls = {
        {kPagePlaceholder, ControlKind::Placeholder, {}, QRect(200, 2, 30, 10)},
        {kPageEdit, ControlKind::Edit, {}, QRect(10, 10, 100, 12)},
        {kPageTree, ControlKind::Tree, {}, QRect(10, 30, 100, 60)},
    };
    return t;
}

// The tab control asks its owner before the user leaves a page.
class GuardedTabs final : public ToTabCtrl
{
public:
    std::function<bool(int)> mayLeave = [](int) { return true; };
    std::vector<int> asked;

protected:
    bool CanLeavePage(int index) override
    {
        asked.push_back(index);
        return mayLeave(index);
    }
};

class Page final : public ToBaseDlg<ToTabPageWnd<CNSFlexDialog>>
{
public:
    Page(DialogKeys keys, QWidget *parent) : ToBaseDlg({60021, &PageTemplate}, parent) { SetDialogKeys(keys); }
    QLineEdit &Edit() { return GetControl<QLineEdit>(this, kPageEdit); }
    QTreeWidget &Tree() { return GetControl<QTreeWidget>(this, kPageTree); }
};

class Frame final : public ToBaseDlg<CNSFlexDialog>
{
public:
    Frame() : ToBaseDlg({60020, &FrameTemplate}, nullptr) {}

    QWidget *CreateCustomControl(const ControlTemplate &control) override
    {
        return control.id == kTabs ? &m_tabs : nullptr;
    }
    bool OnInitDialog() override
    {
        ToBaseDlg::OnInitDialog();
        keeping = std::make_unique<Page>(DialogKeys::KeptByPage, &m_tabs);
        passing = std::make_unique<Page>(DialogKeys::ReachDialog, &m_tabs);
        third = std::make_unique<Page>(DialogKeys::KeptByPage, &m_tabs);
        EXPECT_EQ(AddTabPage(m_tabs, *keeping, QStringLiteral("Keeping")), 0);
        EXPECT_EQ(AddTabPage(m_tabs, *passing, QStringLiteral("Passing")), 1);
        EXPECT_EQ(AddTabPage(m_tabs, *third, QStringLiteral("Third")), 2);
        return true;
    }
    std::u16string HelpTopic() const override
    {
        return u"FRAME_TAB_" + std::u16string(1, u'0' + m_tabs.currentIndex());
    }

    GuardedTabs m_tabs; // before the pages, so it outlives them
    std::unique_ptr<Page> keeping, passing, third;
};

class TabFrame : public ::testing::Test
{
protected:
    TabFrame()
    {
        uitest::Application();
        std::memset(&m_font, 0, sizeof m_font);
        m_font.lfHeight = -12;
        std::memcpy(m_font.lfFaceName, u"DejaVu Serif", sizeof(u"DejaVu Serif"));
        m_frame = std::make_unique<Frame>();
        m_frame->SetHostSettings({m_font, m_help.Target(5)});
        m_frame->SetPrompts(m_prompts);
        EXPECT_EQ(m_frame->CreateModeless(nullptr), 1);
        QApplication::setActiveWindow(m_frame.get());
        EXPECT_TRUE(QTest::qWaitForWindowActive(m_frame.get()));
    }
    ~TabFrame() override
    {
        m_frame.reset();
        uitest::ExpectNoWindowsLeft();
    }
    GuardedTabs &Tabs() { return m_frame->m_tabs; }
    static void Press(Qt::Key key, Qt::KeyboardModifiers modifiers = Qt::NoModifier)
    {
        QWidget *focused = QApplication::focusWidget();
        ASSERT_NE(focused, nullptr) << "nothing has the keyboard";
        QTest::keyClick(focused, key, modifiers);
    }
    bool Open() const { return m_frame->isVisible(); }

    LOGFONTW m_font;
    uitest::HelpRecorder m_help;
    uitest::ScriptedPrompts m_prompts;
    std::unique_ptr<Frame> m_frame;
};

TEST_F(TabFrame, PagesAreBuiltFromTheirTemplatesWithTheHostFont)
{
    Page &page = *m_frame->keeping;
    EXPECT_EQ(page.parentWidget()->parentWidget(), &Tabs()) << "inside the tab control's stack";
    EXPECT_EQ(page.font().family(), QStringLiteral("DejaVu Serif")) << "the frame's host font, not the template's";
    EXPECT_EQ(page.font().pointSize(), 9);
    EXPECT_EQ(page.Edit().geometry(), DialogUnitsOf(page.font()).ToPixels(QRect(10, 10, 100, 12)));
    EXPECT_FALSE(page.isWindow());
}

TEST_F(TabFrame, TabGoesFromTheStripIntoThePageAndFromItsEndToTheButtons)
{
    Tabs().tabBar()->setFocus();
    Press(Qt::Key_Tab);
    EXPECT_EQ(QApplication::focusWidget(), &m_frame->keeping->Edit()) << "the strip leads into the page";
    Press(Qt::Key_Tab);
    EXPECT_EQ(QApplication::focusWidget(), &m_frame->keeping->Tree());
    Press(Qt::Key_Tab);
    EXPECT_EQ(QApplication::focusWidget(), &GetControl<QWidget>(m_frame.get(), IDOK)) << "past the page's end";
}

TEST_F(TabFrame, PagesThatKeepEnterAndEscapeLeaveTheDialogOpen)
{
    m_frame->keeping->Edit().setFocus();
    Press(Qt::Key_Return);
    Press(Qt::Key_Escape);
    Press(Qt::Key_Enter, Qt::KeypadModifier);
    EXPECT_TRUE(Open());
    EXPECT_TRUE(m_frame->keeping->isVisible()) << "a page never hides itself";
}

TEST_F(TabFrame, PagesThatHandThemOnReachOkAndCancel)
{
    ASSERT_TRUE(Tabs().RequestPage(1));
    m_frame->passing->Edit().setFocus();
    Press(Qt::Key_Return);
    EXPECT_FALSE(Open());
    EXPECT_EQ(m_frame->result(), kResultOk) << "Enter reached the default button";

    m_frame->show();
    QTest::keyClick(&m_frame->passing->Edit(), Qt::Key_Escape);
    EXPECT_FALSE(Open());
    EXPECT_EQ(m_frame->result(), kResultCancel);
}

TEST_F(TabFrame, EscapeDuringARenameEndsOnlyTheRename)
{
    ASSERT_TRUE(Tabs().RequestPage(1));
    QTreeWidget &tree = m_frame->passing->Tree();
    auto *item = new QTreeWidgetItem(&tree, {QStringLiteral("Data")});
    item->setFlags(item->flags() | Qt::ItemIsEditable);
    tree.setFocus();
    tree.editItem(item);
    auto *first = uitest::LabelEditor(tree);
    ASSERT_NE(first, nullptr) << "the label editor";
    QTest::keyClicks(first, QStringLiteral("X"));
    QTest::keyClick(first, Qt::Key_Escape);
    EXPECT_TRUE(Open()) << "Escape went to the label editor";
    EXPECT_EQ(item->text(0), QStringLiteral("Data"));
    tree.editItem(item);
    auto *editor = uitest::LabelEditor(tree);
    ASSERT_NE(editor, nullptr) << "the label editor";
    editor->selectAll();
    QTest::keyClicks(editor, QStringLiteral("Renamed"));
    QTest::keyClick(editor, Qt::Key_Return);
    EXPECT_TRUE(Open()) << "Enter went to the label editor";
    EXPECT_TRUE(QTest::qWaitFor([item] { return item->text(0) == QStringLiteral("Renamed"); })) << "committed";
}

TEST_F(TabFrame, ARefusedLeaveKeepsThePageForClicksKeysAndWheel)
{
    QSignalSpy changed(&Tabs(), &QTabWidget::currentChanged);
    Tabs().mayLeave = [](int) { return false; };
    QTabBar &bar = *Tabs().tabBar();

    QTest::mouseClick(&bar, Qt::LeftButton, {}, bar.tabRect(2).center());
    m_frame->keeping->Edit().setFocus();
    Press(Qt::Key_Tab, Qt::ControlModifier);
    Press(Qt::Key_PageDown, Qt::ControlModifier);
    bar.setFocus();
    Press(Qt::Key_Right);
    QWheelEvent wheel(QPointF(bar.tabRect(0).center()), bar.mapToGlobal(QPointF(bar.tabRect(0).center())), {},
                      QPoint(0, -120), Qt::NoButton, {}, Qt::NoScrollPhase, false);
    QApplication::sendEvent(&bar, &wheel);
    EXPECT_EQ(Tabs().currentIndex(), 0);
    EXPECT_EQ(changed.count(), 0) << "not even a change back and forth";
    EXPECT_EQ(Tabs().asked, (std::vector<int>{0, 0, 0, 0, 0})) << "click, Ctrl+Tab, Ctrl+PageDown, Right, wheel";

    Tabs().mayLeave = [](int) { return true; };
    QTest::mouseClick(&bar, Qt::LeftButton, {}, bar.tabRect(2).center());
    EXPECT_EQ(Tabs().currentIndex(), 2);
    bar.setFocus();
    Press(Qt::Key_Left);
    EXPECT_EQ(Tabs().currentIndex(), 1);
    EXPECT_EQ(changed.count(), 2);
    Tabs().setCurrentIndex(0); // the program's own changes are not the user's
    EXPECT_EQ(Tabs().asked.size(), 7u);
}

TEST_F(TabFrame, HelpAndPromptsReachPagesAndNestedDialogs)
{
    EXPECT_EQ(&m_frame->keeping->Prompts(), &m_prompts);
    m_frame->keeping->Ask(
        {QStringLiteral("asked by a page"), QStringLiteral("Page"), MessageIcon::Warning, MessageButtons::OkCancel});

    CNSFlexDialog nested(m_frame->keeping.get());
    nested.SetHelpTopic(u"NESTED");
    EXPECT_EQ(&nested.Prompts(), &m_prompts);
    const std::optional<LOGFONTW> inherited = nested.HostFont();
    ASSERT_TRUE(inherited);
    EXPECT_EQ(std::memcmp(&*inherited, &m_font, sizeof m_font), 0);
    QTest::keyClick(&nested, Qt::Key_F1);

    m_frame->keeping->Edit().setFocus();
    Press(Qt::Key_F1); // on a page: the dialog's topic for the current page
    EXPECT_EQ(m_help.calls, (Lines{"NESTED@5", "FRAME_TAB_0@5"}));
    EXPECT_EQ(m_prompts.Lines(), Lines{"Page | asked by a page | warning | ok-cancel"});

    uitest::ScriptedPrompts own;
    nested.SetPrompts(own);
    EXPECT_EQ(&nested.Prompts(), &own) << "the nearest window's prompts count";
    CNSFlexDialog alone;
    EXPECT_EQ(&alone.Prompts(), &QtPrompts()) << "without any: Qt's own";
    EXPECT_FALSE(alone.HostFont().has_value());
}

} // namespace
