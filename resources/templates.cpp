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
    dialog.controls.push_back({IDCANCEL, ControlKind::Button, LoadString(Str::Cancel), QRect(left + 54, top, 50, 14)});
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

DialogTemplate SorvikPropertiesTemplate()
{
    DialogTemplate dialog;
    dialog.id = IDD_SORVIK_PROPERTIES;
    dialog.title = LoadString(Str::PropertiesTitle);
    dialog.size = QSize(360, 220);
    dialog.fontFace = QString::fromUtf16(kTemplateFace);
    dialog.pointSize = 8;
    dialog.controls = {
        {IDC_PROPERTY_TABS, ControlKind::Custom, {}, QRect(7, 25, 346, 167)},
        {IDC_IMPORT, ControlKind::Button, LoadString(Str::ImportButton), QRect(247, 6, 50, 14)},
        {IDC_EXPORT, ControlKind::Button, LoadString(Str::ExportButton), QRect(303, 6, 50, 14)},
    };
    AddStandardButtons(dialog, 199, 195);
    dialog.controls.push_back({IDC_CONFIG_ERROR_TEXT, ControlKind::Text, LoadString(Str::ConfigurationReadError),
                               QRect(36, 12, 317, 20), style::kHidden});
    dialog.controls.push_back(
        {IDC_CONFIG_ERROR_ICON, ControlKind::Icon, QStringLiteral("error"), QRect(7, 7, 21, 21), style::kHidden});
    return dialog;
}

DialogTemplate SearchAreasTemplate()
{
    DialogTemplate page;
    page.id = IDD_SEARCH_AREAS;
    page.size = QSize(338, 146);
    page.fontFace = QString::fromUtf16(kTemplateFace);
    page.pointSize = 8;
    page.controls = {
        {IDC_SEARCH_AREAS_TOOLBAR, ControlKind::Placeholder, {}, QRect(250, 3, 80, 16)},
        {IDC_SEARCH_AREA_TREE, ControlKind::Custom, {}, QRect(7, 22, 324, 117)},
    };
    return page;
}

DialogTemplate WaitTemplate()
{
    DialogTemplate window;
    window.id = IDD_WAIT;
    window.size = QSize(160, 44);
    window.fontFace = QString::fromUtf16(kTemplateFace);
    window.pointSize = 8;
    window.visible = false;
    window.controls = {
        {IDC_WAIT_PLACEHOLDER, ControlKind::Placeholder, {}, QRect(0, 0, 160, 44)},
        {IDC_WAIT_ANIMATION, ControlKind::Animation, {}, QRect(0, 0, 160, 44)},
    };
    return window;
}

} // namespace resources
