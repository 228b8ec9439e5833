#pragma once

// Dialog templates: each control with its id, kind, text and rectangle in
// dialog units. Dialog units scale with the dialog font (a quarter of the
// average character width, an eighth of the character height), so a
// template keeps its proportions in any face and size.

#include <QRect>
#include <QSize>
#include <QString>
#include <QStringList>

#include <cstdint>
#include <functional>
#include <stdexcept>
#include <vector>

class QFont;
class QWidget;

namespace sharedsource {

enum class ControlKind
{
    Label, // static text; its mnemonic goes to the next control
    Text,  // static text that wraps and takes no mnemonic
    Edit,
    Button,
    DefaultButton,
    RadioButton,
    CheckBox,
    GroupBox,
    ComboBox,     // the rectangle's height is the height with the list dropped down
    Icon,         // text names an image set
    BitmapButton, // flat button; text names an image set, toolTip its tip
    ReportList,   // ToReportList; items are the column titles
    Tree,         // a tree without header
    SpinEdit,     // ToSpinEdit: digits with up and down buttons
    TimePicker,   // hours and minutes, "HH:mm"
    TabControl,   // ToTabCtrl
    Animation,    // ToAnimation; text names the animation resource
    Placeholder,  // an invisible rectangle by which something else is placed
    Custom,       // the dialog's own control class, made by the dialog (CreateCustomControl)
};

namespace style {
constexpr unsigned kGroup = 1; // starts a group of radio buttons
constexpr unsigned kReadOnly = 2;
constexpr unsigned kDisabled = 4;
constexpr unsigned kHidden = 8;    // created hidden: error panels, hints shown on demand
constexpr unsigned kNoHeader = 16; // a report list without column titles
constexpr unsigned kSingleSelection = 32;
} // namespace style

struct ControlTemplate
{
    int id = 0;
    ControlKind kind = ControlKind::Label;
    QString text;
    QRect rect; // dialog units
    unsigned styles = 0;
    QString toolTip;
    QStringList items; // a combo box's initial list, a report list's column titles
};

struct DialogTemplate
{
    std::uint16_t id = 0;
    QString title;
    QSize size; // client size in dialog units
    QString fontFace;
    int pointSize = 8;
    bool visible = true; // false: a modeless window stays hidden until it shows itself
    std::vector<ControlTemplate> controls;
};

// Command ids of the standard buttons.
constexpr int IDOK = 1;
constexpr int IDCANCEL = 2;
constexpr int IDHELP = 9;
constexpr int ID_APPLY_NOW = 12321;

// A dialog's template: its resource id and the function that builds it.
using TemplateFactory = DialogTemplate (*)();
struct TemplateRef
{
    std::uint16_t id = 0;
    TemplateFactory make = nullptr;
};

// Pixels per dialog unit for a font.
struct DialogUnits
{
    int baseX;
    int baseY;
    QRect ToPixels(const QRect &units) const;
    QSize ToPixels(const QSize &units) const;
};
DialogUnits DialogUnitsOf(const QFont &font);

// Makes the control of a Custom entry, already a child of the dialog; null
// when the dialog has no such control (a fault of the dialog).
using CustomControlFactory = std::function<QWidget *(const ControlTemplate &)>;

// Builds the template's controls as children of dialog, in template order
// (which is the focus order), sets the dialog's font, title and client size.
// Throws ControlError when a Custom entry gets no control.
void BuildFromTemplate(QWidget &dialog, const DialogTemplate &dialogTemplate, const CustomControlFactory &custom = {});

// A control that is not there or not of the kind asked for: a fault of the
// dialog's code, never of the user's input.
class ControlError final : public std::logic_error
{
public:
    using std::logic_error::logic_error;
};

// The control with this id among dialog's own controls (not those of its
// pages), or null. For controls that a template may lack.
QWidget *FindControl(const QWidget *dialog, int id);
[[noreturn]] void ThrowControlError(const QWidget *dialog, int id, const char *expected);

// The control with this id, which must be there and be a Widget.
template <typename Widget>
Widget &GetControl(const QWidget *dialog, int id)
{
    QWidget *control = FindControl(dialog, id);
    auto *typed = dynamic_cast<Widget *>(control);
    if (!typed)
        ThrowControlError(dialog, id, typeid(Widget).name());
    return *typed;
}

inline constexpr char kControlIdProperty[] = "sorvikControlId";
inline constexpr char kDroppedHeightProperty[] = "sorvikDroppedHeight";
// A combo box's height with its list dropped down.
int DroppedHeight(const QWidget &combo);

} // namespace sharedsource
