// Tab and Ctrl+Tab across the pages of a tab control, with real key presses.

#include "sharedsource/tabpagewnd.h"
#include "sharedsource/flexdialog.h"
#include "uitest.h"

#include <QLineEdit>
#include <QPushButton>
#include <QTest>
#include <QVBoxLayout>

#include <gtest/gtest.h>

#include <memory>

namespace {

using namespace sharedsource;
using Page = ToTabPageWnd<CNSFlexDialog>;

class TabPages : public ::testing::Test
{
protected:
    TabPages() : m_owner(MakeDialog()), m_dialog(*m_owner)
    {
        auto *layout = new QVBoxLayout(&m_dialog);
        m_before = new QPushButton(QStringLiteral("before"), &m_dialog);
        m_tabs = new ToTabCtrl(&m_dialog);
        m_after = new QPushButton(QStringLiteral("after"), &m_dialog);
        layout->addWidget(m_before);
        layout->addWidget(m_tabs);
        layout->addWidget(m_after);
        for (int i = 0; i < 3; ++i) {
            auto *page = new Page;
            auto *pageLayout = new QVBoxLayout(page);
            for (int j = 0; j < 2; ++j) {
                m_edits[i][j] = new QLineEdit(page);
                pageLayout->addWidget(m_edits[i][j]);
            }
            m_tabs->addTab(page, QStringLiteral("page %1").arg(i));
        }
        m_tabs->setTabEnabled(1, false);
        m_dialog.show();
        QApplication::setActiveWindow(&m_dialog);
        EXPECT_TRUE(QTest::qWaitForWindowActive(&m_dialog));
    }
    ~TabPages() override
    {
        m_owner.reset();
        uitest::ExpectNoWindowsLeft();
    }
    static std::unique_ptr<QDialog> MakeDialog()
    {
        uitest::Application();
        return std::make_unique<QDialog>();
    }

    static void Press(Qt::Key key, Qt::KeyboardModifiers modifiers = Qt::NoModifier)
    {
        QWidget *focused = QApplication::focusWidget();
        ASSERT_NE(focused, nullptr) << "nothing has the keyboard";
        QTest::keyClick(focused, key, modifiers);
    }
    void FocusOn(QWidget *w)
    {
        w->setFocus(Qt::OtherFocusReason);
        ASSERT_EQ(QApplication::focusWidget(), w);
    }

    std::unique_ptr<QDialog> m_owner;
    QDialog &m_dialog;
    QPushButton *m_before;
    QPushButton *m_after;
    ToTabCtrl *m_tabs;
    QLineEdit *m_edits[3][2];
};

TEST_F(TabPages, TabWalksThroughThePageAndLeavesAfterItsLastControl)
{
    FocusOn(m_edits[0][0]);
    Press(Qt::Key_Tab);
    EXPECT_EQ(QApplication::focusWidget(), m_edits[0][1]);
    Press(Qt::Key_Tab);
    EXPECT_EQ(QApplication::focusWidget(), m_after) << "past the last control: what follows the tab control";
    FocusOn(m_edits[0][1]);
    Press(Qt::Key_Backtab, Qt::ShiftModifier);
    EXPECT_EQ(QApplication::focusWidget(), m_edits[0][0]) << "Shift+Tab is the dialog's own handling";
}

TEST_F(TabPages, CtrlTabSwitchesToEnabledPagesWithoutWrapping)
{
    int notified = 0;
    QObject::connect(m_tabs, &QTabWidget::currentChanged, [&notified] { ++notified; });
    FocusOn(m_edits[0][0]);
    Press(Qt::Key_Tab, Qt::ControlModifier);
    EXPECT_EQ(m_tabs->currentIndex(), 2) << "the disabled page is skipped";
    EXPECT_EQ(notified, 1);

    FocusOn(m_edits[2][0]);
    Press(Qt::Key_Tab, Qt::ControlModifier);
    EXPECT_EQ(m_tabs->currentIndex(), 2) << "no wrap at the end";
    Press(Qt::Key_Backtab, Qt::ControlModifier | Qt::ShiftModifier);
    EXPECT_EQ(m_tabs->currentIndex(), 0);
    FocusOn(m_edits[0][1]);
    Press(Qt::Key_Backtab, Qt::ControlModifier | Qt::ShiftModifier);
    EXPECT_EQ(m_tabs->currentIndex(), 0) << "no wrap at the start";
    EXPECT_EQ(notified, 2);

    m_tabs->SetKeyboardSwitching(false);
    Press(Qt::Key_Tab, Qt::ControlModifier);
    EXPECT_EQ(m_tabs->currentIndex(), 0) << "switching by keyboard is off";
}

TEST_F(TabPages, AnInnerTabControlHandsOnToItsOuterPage)
{
    auto *outer = static_cast<Page *>(m_tabs->widget(0));
    auto *inner = new ToTabCtrl(outer);
    auto *innerPage = new Page;
    auto *innerEdit = new QLineEdit(innerPage);
    (void)innerEdit;
    inner->addTab(innerPage, QStringLiteral("inner"));
    outer->layout()->addWidget(inner);
    auto *last = new QLineEdit(outer);
    outer->layout()->addWidget(last);
    // Focus order: the outer page's edits, the inner tab control, then last.
    QWidget::setTabOrder(m_edits[0][1], inner);
    QWidget::setTabOrder(inner, last);
    inner->show();
    innerEdit->show();
    last->show();

    FocusOn(innerEdit);
    Press(Qt::Key_Tab);
    EXPECT_EQ(QApplication::focusWidget(), last);
}

} // namespace
