// The triggers dialog with real widgets.

#include "pages/indexmonitoringdlg.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
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
using sharedsource::GetControl;

using resources::LoadString;
using resources::Str;

const QString kImmediate = LoadString(Str::TriggerImmediateExplanation);
const QString kScheduled = LoadString(Str::TriggerScheduleExplanation);

class Triggers : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { uitest::Application(); }
    void TearDown() override { uitest::ExpectNoWindowsLeft(); }

    static QRadioButton &Radio(QWidget &dialog, int id) { return GetControl<QRadioButton>(&dialog, id); }
    // On the indicator: a radio button takes clicks on its indicator and label only.
    static void Click(QRadioButton &radio)
    {
        QTest::mouseClick(&radio, Qt::LeftButton, Qt::NoModifier, QPoint(6, radio.height() / 2));
    }
    static QString Explanation(QWidget &dialog)
    {
        return GetControl<QLabel>(&dialog, resources::IDC_TRIGGER_EXPLANATION).text();
    }
};

TEST_F(Triggers, TheExplanationFollowsTheButtonsAndOnlyOkTakesTheChoice)
{
    {
        uitest::HelpRecorder help;
        CIndexMonitoringDlg dialog(1);
        dialog.SetHelpTarget(help.Target(0));
        ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
        EXPECT_EQ(dialog.windowTitle(), LoadString(Str::TriggersTitle));
        EXPECT_TRUE(Radio(dialog, resources::IDC_TRIGGER_FILE_CHANGES).isChecked());
        EXPECT_EQ(Explanation(dialog), kImmediate);
        Click(Radio(dialog, resources::IDC_TRIGGER_NONE));
        EXPECT_EQ(Explanation(dialog), kScheduled);
        GetControl<QPushButton>(&dialog, resources::IDHELP).click();
        GetControl<QPushButton>(&dialog, resources::IDCANCEL).click();
        EXPECT_EQ(dialog.result(), sharedsource::kResultCancel);
        EXPECT_EQ(dialog.Trigger(), 1) << "Cancel takes nothing";
        EXPECT_EQ(help.calls, std::vector<std::string>{"ROAM_SEARCH_CRAWLER_CONTROL_DIALOG@0"});
    }
    CIndexMonitoringDlg dialog(0);
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    EXPECT_EQ(Explanation(dialog), kScheduled);
    QTest::keyClick(&dialog, Qt::Key_F1); // no callback: handled, nothing happens
    Click(Radio(dialog, resources::IDC_TRIGGER_FILE_CHANGES));
    GetControl<QPushButton>(&dialog, resources::IDOK).click();
    EXPECT_EQ(dialog.result(), sharedsource::kResultOk);
    EXPECT_TRUE(dialog.IsChangeTriggered());
}

TEST_F(Triggers, ButtonsAndTextStretchWithTheWindow)
{
    CIndexMonitoringDlg dialog(0);
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    using namespace resources;
    uitest::ExpectLayout(dialog, QSize(100, 50),
                         {{IDC_TRIGGER_NONE, 0, 0, 100, 0},
                          {IDC_TRIGGER_EXPLANATION, 0, 0, 100, 0},
                          {IDC_TRIGGER_ICON},
                          {IDOK, 0, 50, 0, 50}});
    EXPECT_FALSE(GetControl<QLabel>(&dialog, resources::IDC_TRIGGER_ICON).pixmap().isNull());
    dialog.close();
}

} // namespace
