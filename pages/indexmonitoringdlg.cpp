#include "pages/indexmonitoringdlg.h"

#include "resources/strings.h"
#include "resources/templates.h"
#include "sharedsource/imageset.h"

#include <QLabel>
#include <QRadioButton>

namespace pages {

using resources::LoadString;
using resources::Str;

CIndexMonitoringDlg::CIndexMonitoringDlg(std::int32_t trigger, QWidget *parent)
    : ToBaseDlg(resources::kIndexMonitoringTemplate, parent), m_trigger(trigger)
{
    SetHelpTopic(kHelpTopic);
    using namespace resources;
    AddConstraint(IDC_TRIGGER_NONE, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDC_TRIGGER_FILE_CHANGES, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDC_TRIGGER_EXPLANATION, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDOK, NSFlexHorizontallyFixed, NSFlexMoveDown);
    AddConstraint(IDCANCEL, NSFlexHorizontallyFixed, NSFlexMoveDown);
    AddConstraint(IDHELP, NSFlexHorizontallyFixed, NSFlexMoveDown);
}

QRadioButton &CIndexMonitoringDlg::Radio(int id) const
{
    return sharedsource::GetControl<QRadioButton>(this, id);
}

bool CIndexMonitoringDlg::OnInitDialog()
{
    ToBaseDlg::OnInitDialog();
    setWindowIcon(sharedsource::LoadImage(QStringLiteral("application"), logicalDpiY()));
    // The explanation follows the buttons at once; the trigger only at OK.
    const auto follow = [this](int id, std::int32_t trigger) {
        connect(&Radio(id), &QRadioButton::clicked, this, [this, trigger] { ShowExplanation(trigger); });
    };
    follow(resources::IDC_TRIGGER_NONE, 0);
    follow(resources::IDC_TRIGGER_FILE_CHANGES, 1);
    ShowExplanation(m_trigger);
    DataExchange(false);
    return true;
}

bool CIndexMonitoringDlg::DataExchange(bool save)
{
    if (save) {
        m_trigger = Radio(resources::IDC_TRIGGER_FILE_CHANGES).isChecked() ? 1 : 0;
    } else {
        Radio(resources::IDC_TRIGGER_NONE).setChecked(m_trigger == 0);
        Radio(resources::IDC_TRIGGER_FILE_CHANGES).setChecked(m_trigger != 0);
    }
    return true;
}

void CIndexMonitoringDlg::ShowExplanation(std::int32_t trigger)
{
    sharedsource::GetControl<QLabel>(this, resources::IDC_TRIGGER_EXPLANATION)
        .setText(LoadString(trigger == 1 ? Str::TriggerImmediateExplanation : Str::TriggerScheduleExplanation));
}

} // namespace pages
