#include "sharedsource/dialogtemplate.h"

#include "sharedsource/animation.h"
#include "sharedsource/imageset.h"
#include "sharedsource/reportlist.h"
#include "sharedsource/spinedit.h"
#include "sharedsource/tabctrl.h"

#include <QButtonGroup>
#include <QCheckBox>
#include <QComboBox>
#include <QFontMetrics>
#include <QGroupBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QHeaderView>
#include <QTimeEdit>
#include <QToolButton>
#include <QTreeWidget>
#include <QWidget>

namespace sharedsource {

namespace {

int MulDiv(int value, int numerator, int denominator)
{
    const long long product = static_cast<long long>(value) * numerator;
    const long long half = denominator / 2;
    return static_cast<int>(product >= 0 ? (product + half) / denominator : (product - half) / denominator);
}

QWidget *MakeReportList(QWidget &dialog, const ControlTemplate &control)
{
    auto *list = new ToReportList(&dialog);
    list->SetColumns(control.items.isEmpty() ? QStringList{QString()} : control.items);
    list->setHeaderHidden(control.styles & style::kNoHeader);
    if (control.styles & style::kSingleSelection)
        list->setSelectionMode(QAbstractItemView::SingleSelection);
    return list;
}

QWidget *MakeTree(QWidget &dialog)
{
    auto *tree = new QTreeWidget(&dialog);
    tree->setHeaderHidden(true);
    tree->setColumnCount(1);
    return tree;
}

QWidget *MakeTimePicker(QWidget &dialog)
{
    auto *picker = new QTimeEdit(&dialog);
    picker->setDisplayFormat(QStringLiteral("HH:mm"));
    return picker;
}

QWidget *MakeAnimation(QWidget &dialog, const ControlTemplate &control)
{
    auto *animation = new ToAnimation(&dialog);
    if (!control.text.isEmpty())
        animation->Open(control.text);
    return animation;
}

QWidget *MakePlaceholder(QWidget &dialog)
{
    auto *placeholder = new QWidget(&dialog);
    placeholder->setFocusPolicy(Qt::NoFocus);
    placeholder->setAttribute(Qt::WA_TransparentForMouseEvents);
    placeholder->hide();
    return placeholder;
}

QWidget *MakeControl(QWidget &dialog, const ControlTemplate &control, QButtonGroup *&radioGroup,
                     const CustomControlFactory &custom)
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
    case ControlKind::ReportList:
        return MakeReportList(dialog, control);
    case ControlKind::Tree:
        return MakeTree(dialog);
    case ControlKind::SpinEdit:
        return new ToSpinEdit(&dialog);
    case ControlKind::TimePicker:
        return MakeTimePicker(dialog);
    case ControlKind::TabControl:
        return new ToTabCtrl(&dialog);
    case ControlKind::Animation:
        return MakeAnimation(dialog, control);
    case ControlKind::Placeholder:
        return MakePlaceholder(dialog);
    case ControlKind::Custom: {
        QWidget *widget = custom ? custom(control) : nullptr;
        if (!widget)
            throw ControlError(QStringLiteral("dialog %1 makes no control for its entry %2")
                                   .arg(dialog.metaObject()->className())
                                   .arg(control.id)
                                   .toStdString());
        if (widget->parentWidget() != &dialog)
            widget->setParent(&dialog);
        return widget;
    }
    }
    return new QWidget(&dialog);
}

bool TakesMnemonicOfLabel(ControlKind kind)
{
    return kind != ControlKind::Label && kind != ControlKind::Text && kind != ControlKind::Placeholder;
}

} // namespace

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

void BuildFromTemplate(QWidget &dialog, const DialogTemplate &dialogTemplate, const CustomControlFactory &custom)
{
    QFont font(dialogTemplate.fontFace);
    font.setPointSize(dialogTemplate.pointSize);
    dialog.setFont(font);
    dialog.setWindowTitle(dialogTemplate.title);
    const DialogUnits units = DialogUnitsOf(font);

    QButtonGroup *radioGroup = nullptr;
    QLabel *pendingBuddy = nullptr;
    for (const ControlTemplate &control : dialogTemplate.controls) {
        QWidget *widget = MakeControl(dialog, control, radioGroup, custom);
        widget->setProperty(kControlIdProperty, control.id);
        widget->setObjectName(QStringLiteral("control%1").arg(control.id));
        if (!control.toolTip.isEmpty())
            widget->setToolTip(control.toolTip);
        if (control.styles & style::kDisabled)
            widget->setEnabled(false);
        if (control.styles & style::kHidden)
            widget->hide();
        QRect rect = units.ToPixels(control.rect);
        if (control.kind == ControlKind::ComboBox) {
            widget->setProperty(kDroppedHeightProperty, rect.height());
            rect.setHeight(widget->sizeHint().height());
        }
        widget->setGeometry(rect);
        if (pendingBuddy && TakesMnemonicOfLabel(control.kind))
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

void ThrowControlError(const QWidget *dialog, int id, const char *expected)
{
    const QWidget *control = FindControl(dialog, id);
    const QString owner = dialog ? QString::fromLatin1(dialog->metaObject()->className()) : QStringLiteral("(none)");
    const QString what =
        control ? QStringLiteral("is a %1, not the %2 asked for")
                      .arg(QString::fromLatin1(control->metaObject()->className()), QString::fromLatin1(expected))
                : QStringLiteral("does not exist");
    throw ControlError(QStringLiteral("control %1 of %2 %3").arg(id).arg(owner, what).toStdString());
}

int DroppedHeight(const QWidget &combo)
{
    const QVariant value = combo.property(kDroppedHeightProperty);
    return value.isValid() ? value.toInt() : combo.height();
}

} // namespace sharedsource
