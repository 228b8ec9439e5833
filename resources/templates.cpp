#include "resources/templates.h"

#include "resources/strings.h"

namespace resources {

using sharedsource::ControlKind;
using sharedsource::ControlTemplate;
using sharedsource::DialogTemplate;
namespace style = sharedsource::style;

namespace {

// The template's own face; the host's dialog font replaces it at run time.
constexpr char16_t kTemplateFace[] = u"MS Shell Dlg";

void AddStandardButtons(DialogTemplate &dialog, int top, int left)
{
    dialog.controls.push_back({IDOK, ControlKind::DefaultButton, LoadString(Str::Ok), QRect(left, top, 50, 14)});
    dialog.controls.push_back(
        {IDCANCEL, ControlKind::Button, LoadString(Str::Cancel), QRect(left + 54, top, 50, 14)});
    dialog.controls.push_back({IDHELP, ControlKind::Button, LoadString(Str::Help), QRect(left + 108, top, 50, 14)});
}

} // namespace

DialogTemplate AddSearchAreaTemplate()
{
    DialogTemplate dialog;
    dialog.id = IDD_ADD_SEARCH_AREA;
    dialog.title = LoadString(Str::AddSearchAreaTitle);
    dialog.size = QSize(250, 74);
    dialog.fontFace = QString::fromUtf16(kTemplateFace);
    dialog.pointSize = 8;
    dialog.controls = {
        {IDC_ALIAS_LABEL, ControlKind::Label, LoadString(Str::AliasLabel), QRect(7, 9, 52, 8)},
        {IDC_ALIAS, ControlKind::Edit, {}, QRect(62, 7, 181, 13)},
        {IDC_PATH_LABEL, ControlKind::Label, LoadString(Str::PathLabel), QRect(7, 29, 52, 8)},
        {IDC_PATH, ControlKind::Edit, {}, QRect(62, 27, 161, 13)},
        {IDC_BROWSE, ControlKind::BitmapButton, QStringLiteral("browse"), QRect(227, 27, 16, 13), 0,
         LoadString(Str::ChooseFolder)},
    };
    AddStandardButtons(dialog, 53, 85);
    return dialog;
}

DialogTemplate IndexMonitoringTemplate()
{
    DialogTemplate dialog;
    dialog.id = IDD_INDEX_MONITORING;
    dialog.title = LoadString(Str::TriggersTitle);
    dialog.size = QSize(232, 104);
    dialog.fontFace = QString::fromUtf16(kTemplateFace);
    dialog.pointSize = 8;
    dialog.controls = {
        {IDC_TRIGGER_NONE, ControlKind::RadioButton, LoadString(Str::TriggerNone), QRect(10, 10, 212, 10),
         style::kGroup},
        {IDC_TRIGGER_FILE_CHANGES, ControlKind::RadioButton, LoadString(Str::TriggerFileChanges),
         QRect(10, 24, 212, 10)},
        {IDC_TRIGGER_ICON, ControlKind::Icon, QStringLiteral("information"), QRect(10, 44, 21, 21)},
        {IDC_TRIGGER_EXPLANATION, ControlKind::Text, {}, QRect(38, 46, 184, 26)},
    };
    AddStandardButtons(dialog, 82, 64);
    return dialog;
}

} // namespace resources
