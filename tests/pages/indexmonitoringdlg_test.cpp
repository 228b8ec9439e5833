// The triggers dialog with real widgets.

#include "pages/indexmonitoringdlg.h"
#include "resources/resourceids.h"
#include "uitest.h"

#include <QLabel>
#include <QPushButton>
#include <QRadioButton>
#include <QTest>

#include <gtest/gtest.h>

#include <string>

namespace {

using pages::CIndexMonitoringDlg;
using sharedsource::FindControl;
using sharedsource::FindControlAs;

const QString kImmediate = QStringLiteral("Updates the index immediately when files are created or modified.");
const QString kScheduled = QStringLiteral("Updates the index at the time specified in the scheduler.");

std::u16string g_topic;

void RecordHelp(BSTR topic, std::uintptr_t)
{
    g_topic.assign(topic, SysStringLen(topic));
}

class Triggers : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { uitest::Application(); }
    void TearDown() override { uitest::ExpectNoWindowsLeft(); }

    static QRadioButton &Radio(QWidget &dialog, int id) { return *FindControlAs<QRadioButton>(&dialog, id); }
    // On the indicator: a radio button takes clicks on its indicator and label only.
    static void Click(QRadioButton &radio)
    {
        QTest::mouseClick(&radio, Qt::LeftButton, Qt::NoModifier, QPoint(6, radio.height() / 2));
    }
    static QString Explanation(QWidget &dialog)
    {
        return FindControlAs<QLabel>(&dialog, resources::IDC_TRIGGER_EXPLANATION)->text();
    }
};

TEST_F(Triggers, TheExplanationFollowsTheButtonsAndOnlyOkTakesTheChoice)
{
    {
        CIndexMonitoringDlg dialog(1, &RecordHelp, 0, nullptr);
        ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
        EXPECT_EQ(dialog.windowTitle(), QStringLiteral("Automatic Indexing Triggered By"));
        EXPECT_TRUE(Radio(dialog, resources::IDC_TRIGGER_FILE_CHANGES).isChecked());
        EXPECT_EQ(Explanation(dialog), kImmediate);
        Click(Radio(dialog, resources::IDC_TRIGGER_NONE));
        EXPECT_EQ(Explanation(dialog), kScheduled);
        FindControlAs<QPushButton>(&dialog, resources::IDHELP)->click();
        FindControlAs<QPushButton>(&dialog, resources::IDCANCEL)->click();
        EXPECT_EQ(dialog.result(), sharedsource::kResultCancel);
        EXPECT_EQ(dialog.Trigger(), 1) << "Cancel takes nothing";
        EXPECT_EQ(g_topic, u"ROAM_SEARCH_CRAWLER_CONTROL_DIALOG");
    }
    CIndexMonitoringDlg dialog(0, nullptr, 0, nullptr);
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    EXPECT_EQ(Explanation(dialog), kScheduled);
    QTest::keyClick(&dialog, Qt::Key_F1); // no callback: handled, nothing happens
    Click(Radio(dialog, resources::IDC_TRIGGER_FILE_CHANGES));
    FindControlAs<QPushButton>(&dialog, resources::IDOK)->click();
    EXPECT_EQ(dialog.result(), sharedsource::kResultOk);
    EXPECT_TRUE(dialog.IsChangeTriggered());
}

TEST_F(Triggers, ButtonsAndTextStretchWithTheWindow)
{
    CIndexMonitoringDlg dialog(0, nullptr, 0, nullptr);
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    const auto rect = [&dialog](int id) { return FindControl(&dialog, id)->geometry(); };
    const QRect none = rect(resources::IDC_TRIGGER_NONE), text = rect(resources::IDC_TRIGGER_EXPLANATION),
                icon = rect(resources::IDC_TRIGGER_ICON), ok = rect(resources::IDOK);
    dialog.resize(dialog.size() + QSize(100, 50));
    EXPECT_EQ(rect(resources::IDC_TRIGGER_NONE), none.adjusted(0, 0, 100, 0));
    EXPECT_EQ(rect(resources::IDC_TRIGGER_EXPLANATION), text.adjusted(0, 0, 100, 0));
    EXPECT_EQ(rect(resources::IDC_TRIGGER_ICON), icon);
    EXPECT_EQ(rect(resources::IDOK), ok.translated(0, 50));
    EXPECT_FALSE(FindControlAs<QLabel>(&dialog, resources::IDC_TRIGGER_ICON)->pixmap().isNull());
    dialog.close();
}

} // namespace
