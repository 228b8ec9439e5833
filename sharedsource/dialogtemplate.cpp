#include "sharedsource/dialogtemplate.h"

#include "sharedsource/imageset.h"

#include <QButtonGroup>
#include <QCheckBox>
#include <QComboBox>
#include <QFontMetrics>
#include <QGroupBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QToolButton>
#include <QWidget>

#include <map>

namespace sharedsource {

namespace {

std::map<std::uint16_t, TemplateFactory> &Templates()
{
    static std::map<std::uint16_t, TemplateFactory> templates;
    return templates;
}

int MulDiv(int value, int numerator, int denominator)
{
    const long long product = static_cast<long long>(value) * numerator;
    const long long half = denominator / 2;
    return static_cast<int>(product >= 0 ? (product + half) / denominator : (product - half) / denominator);
}

QWidget *MakeControl(QWidget &dialog, const ControlTemplate &control, QButtonGroup *&radioGroup)
{
    switch (control.kind) {
    case ControlKind::Label:
        return new QLabel(control.text, &dialog);
    case ControlKind::Text: {
        auto *text = new QLabel(control.text, &dialog);
        text->setTextFormat(Qt::PlainText);
        text->setWordWrap(true);
        text->setAlignment(Qt::AlignLeft | Qt::AlignTop);
        return text;
    }
    case ControlKind::Edit: {
        auto *edit = new QLineEdit(&dialog);
        edit->setReadOnly(control.styles & style::kReadOnly);
        return edit;
    }
    case ControlKind::Button:
    case ControlKind::DefaultButton: {
        auto *button = new QPushButton(control.text, &dialog);
        button->setAutoDefault(false);
        button->setDefault(control.kind == ControlKind::DefaultButton);
        return button;
    }
    case ControlKind::RadioButton: {
        auto *radio = new QRadioButton(control.text, &dialog);
        if (control.styles & style::kGroup || !radioGroup)
            radioGroup = new QButtonGroup(&dialog);
        radioGroup->addButton(radio);
        return radio;
    }
    case ControlKind::CheckBox:
        return new QCheckBox(control.text, &dialog);
    case ControlKind::GroupBox:
        return new QGroupBox(control.text, &dialog);
    case ControlKind::ComboBox: {
        auto *combo = new QComboBox(&dialog);
        combo->addItems(control.items);
        return combo;
    }
    case ControlKind::Icon: {
        auto *icon = new QLabel(&dialog);
        icon->setPixmap(LoadImage(control.text, dialog.logicalDpiY()));
        icon->setAlignment(Qt::AlignLeft | Qt::AlignTop);
        return icon;
    }
    case ControlKind::BitmapButton: {
        auto *button = new QToolButton(&dialog);
        button->setAutoRaise(true);
        const QPixmap image = LoadImage(control.text, dialog.logicalDpiY());
        button->setIcon(image);
        button->setIconSize(image.size() / image.devicePixelRatio());
        return button;
    }
    }
    return new QWidget(&dialog);
}

} // namespace

void RegisterDialogTemplate(std::uint16_t id, TemplateFactory factory)
{
    Templates()[id] = factory;
}

std::optional<DialogTemplate> LoadDialogTemplate(std::uint16_t id)
{
    const auto found = Templates().find(id);
    if (found == Templates().end())
        return std::nullopt;
    return found->second();
}

QRect DialogUnits::ToPixels(const QRect &units) const
{
    return QRect(MulDiv(units.x(), baseX, 4), MulDiv(units.y(), baseY, 8), MulDiv(units.width(), baseX, 4),
                 MulDiv(units.height(), baseY, 8));
}

QSize DialogUnits::ToPixels(const QSize &units) const
{
    return QSize(MulDiv(units.width(), baseX, 4), MulDiv(units.height(), baseY, 8));
}

DialogUnits DialogUnitsOf(const QFont &font)
{
    const QFontMetrics metrics(font);
    const int alphabet =
        metrics.horizontalAdvance(QStringLiteral("ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz"));
    return DialogUnits{(alphabet / 26 + 1) / 2, metrics.height()};
}

void BuildFromTemplate(QWidget &dialog, const DialogTemplate &dialogTemplate)
{
    QFont font(dialogTemplate.fontFace);
    font.setPointSize(dialogTemplate.pointSize);
    dialog.setFont(font);
    dialog.setWindowTitle(dialogTemplate.title);
    const DialogUnits units = DialogUnitsOf(font);

    QButtonGroup *radioGroup = nullptr;
    QLabel *pendingBuddy = nullptr;
    for (const ControlTemplate &control : dialogTemplate.controls) {
        QWidget *widget = MakeControl(dialog, control, radioGroup);
        widget->setProperty(kControlIdProperty, control.id);
        widget->setObjectName(QStringLiteral("control%1").arg(control.id));
        if (!control.toolTip.isEmpty())
            widget->setToolTip(control.toolTip);
        if (control.styles & style::kDisabled)
            widget->setEnabled(false);
        QRect rect = units.ToPixels(control.rect);
        if (control.kind == ControlKind::ComboBox) {
            widget->setProperty(kDroppedHeightProperty, rect.height());
            rect.setHeight(widget->sizeHint().height());
        }
        widget->setGeometry(rect);
        if (pendingBuddy && control.kind != ControlKind::Label && control.kind != ControlKind::Text)
            pendingBuddy->setBuddy(widget);
        pendingBuddy = control.kind == ControlKind::Label ? static_cast<QLabel *>(widget) : nullptr;
    }
    dialog.resize(units.ToPixels(dialogTemplate.size));
}

QWidget *FindControl(const QWidget *dialog, int id)
{
    if (!dialog)
        return nullptr;
    for (QWidget *child : dialog->findChildren<QWidget *>(QString(), Qt::FindDirectChildrenOnly)) {
        const QVariant value = child->property(kControlIdProperty);
        if (value.isValid() && value.toInt() == id)
            return child;
    }
    return nullptr;
}

int DroppedHeight(const QWidget &combo)
{
    const QVariant value = combo.property(kDroppedHeightProperty);
    return value.isValid() ? value.toInt() : combo.height();
}

} // namespace sharedsource
