#include "pages/indexmonitoringdlg.h"

#include "resources/strings.h"
#include "resources/templates.h"
#include "sharedsource/imageset.h"

#include <QLabel>
#include <QRadioButton>

namespace pages {

using resources::LoadString;
using resources::Str;

CIndexMonitoringDlg::CIndexMonitoringDlg(std::int32_t trigger, SorvikHelpCallback helpCallback,
                                         std::uintptr_t helpContext, const LOGFONTW *hostFont)
    : ToBaseDlg(resources::IDD_INDEX_MONITORING, nullptr), m_trigger(trigger), m_help{helpCallback, helpContext}
{
    resources::RegisterDialogTemplates();
    if (hostFont)
        m_font = *hostFont;
    using namespace resources;
    AddConstraint(IDC_TRIGGER_NONE, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDC_TRIGGER_FILE_CHANGES, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDC_TRIGGER_EXPLANATION, NSFlexExpandRight, NSFlexVerticallyFixed);
    AddConstraint(IDOK, NSFlexHorizontallyFixed, NSFlexMoveDown);
    AddConstraint(IDCANCEL, NSFlexHorizontallyFixed, NSFlexMoveDown);
    AddConstraint(IDHELP, NSFlexHorizontallyFixed, NSFlexMoveDown);
}

bool CIndexMonitoringDlg::GetDialogFont(LOGFONTW &font) const
{
    if (!m_font)
        return false;
    font = *m_font;
    return true;
}

bool CIndexMonitoringDlg::OnInitDialog()
{
    ToBaseDlg::OnInitDialog();
    setWindowIcon(sharedsource::LoadImage(QStringLiteral("application"), logicalDpiY()));
    // The explanation follows the buttons at once; the trigger only at OK.
    const auto follow = [this](int id, std::int32_t trigger) {
        if (auto *radio = sharedsource::FindControlAs<QRadioButton>(this, id))
            connect(radio, &QRadioButton::clicked, this, [this, trigger] { ShowExplanation(trigger); });
    };
    follow(resources::IDC_TRIGGER_NONE, 0);
    follow(resources::IDC_TRIGGER_FILE_CHANGES, 1);
    ShowExplanation(m_trigger);
    DataExchange(false);
    return true;
}

bool CIndexMonitoringDlg::DataExchange(bool save)
{
    auto *none = sharedsource::FindControlAs<QRadioButton>(this, resources::IDC_TRIGGER_NONE);
    auto *changes = sharedsource::FindControlAs<QRadioButton>(this, resources::IDC_TRIGGER_FILE_CHANGES);
    if (!none || !changes)
        return false;
    if (save) {
        m_trigger = changes->isChecked() ? 1 : 0;
    } else {
        none->setChecked(m_trigger == 0);
        changes->setChecked(m_trigger != 0);
    }
    return true;
}

void CIndexMonitoringDlg::ShowExplanation(std::int32_t trigger)
{
    if (auto *text = sharedsource::FindControlAs<QLabel>(this, resources::IDC_TRIGGER_EXPLANATION))
        text->setText(LoadString(trigger == 1 ? Str::TriggerImmediateExplanation : Str::TriggerScheduleExplanation));
}

void CIndexMonitoringDlg::OnHelp()
{
    sharedsource::ShowHelp(m_help, kHelpTopic);
}

} // namespace pages
