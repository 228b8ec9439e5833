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
#include <optional>
#include <vector>

class QFont;
class QWidget;

namespace sharedsource {

enum class ControlKind
{
    Label,         // static text; its mnemonic goes to the next control
    Text,          // static text that wraps and takes no mnemonic
    Edit,
    Button,
    DefaultButton,
    RadioButton,
    CheckBox,
    GroupBox,
    ComboBox,      // the rectangle's height is the height with the list dropped down
    Icon,          // text names an image set
    BitmapButton,  // flat button; text names an image set, toolTip its tip
};

namespace style {
constexpr unsigned kGroup = 1;    // starts a group of radio buttons
constexpr unsigned kReadOnly = 2;
constexpr unsigned kDisabled = 4;
} // namespace style

struct ControlTemplate
{
    int id = 0;
    ControlKind kind = ControlKind::Label;
    QString text;
    QRect rect; // dialog units
    unsigned styles = 0;
    QString toolTip;
    QStringList items; // a combo box's initial list
};

struct DialogTemplate
{
    std::uint16_t id = 0;
    QString title;
    QSize size; // client size in dialog units
    QString fontFace;
    int pointSize = 8;
    std::vector<ControlTemplate> controls;
};

// Command ids of the standard buttons.
constexpr int IDOK = 1;
constexpr int IDCANCEL = 2;
constexpr int IDHELP = 9;
constexpr int ID_APPLY_NOW = 12321;

// Templates are registered by whoever owns them (the module's resources)
// and looked up by id.
using TemplateFactory = DialogTemplate (*)();
void RegisterDialogTemplate(std::uint16_t id, TemplateFactory factory);
std::optional<DialogTemplate> LoadDialogTemplate(std::uint16_t id);

// Pixels per dialog unit for a font.
struct DialogUnits
{
    int baseX;
    int baseY;
    QRect ToPixels(const QRect &units) const;
    QSize ToPixels(const QSize &units) const;
};
DialogUnits DialogUnitsOf(const QFont &font);

// Builds the template's controls as children of dialog, in template order
// (which is the focus order), sets the dialog's font, title and client size.
void BuildFromTemplate(QWidget &dialog, const DialogTemplate &dialogTemplate);

// The control with this id among dialog's own controls (not those of its pages), or null.
QWidget *FindControl(const QWidget *dialog, int id);
template <typename Widget>
Widget *FindControlAs(const QWidget *dialog, int id)
{
    return qobject_cast<Widget *>(FindControl(dialog, id));
}

inline constexpr char kControlIdProperty[] = "sorvikControlId";
inline constexpr char kDroppedHeightProperty[] = "sorvikDroppedHeight";
// A combo box's height with its list dropped down.
int DroppedHeight(const QWidget &combo);

} // namespace sharedsource
