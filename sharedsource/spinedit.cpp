#include "sharedsource/spinedit.h"

#include <QKeyEvent>
#include <QLineEdit>
#include <QRegularExpressionValidator>
#include <QToolButton>

#include <algorithm>
#include <limits>

namespace sharedsource {

namespace {

constexpr int kMaxDigits = 10; // enough for every 32-bit value

QToolButton *MakeArrow(Qt::ArrowType arrow, QWidget *parent)
{
    auto *button = new QToolButton(parent);
    button->setArrowType(arrow);
    button->setAutoRepeat(true);
    button->setFocusPolicy(Qt::NoFocus);
    return button;
}

} // namespace

ToSpinEdit::ToSpinEdit(QWidget *parent)
    : QWidget(parent),
      m_edit(new QLineEdit(this)),
      m_up(MakeArrow(Qt::UpArrow, this)),
      m_down(MakeArrow(Qt::DownArrow, this))
{
    m_edit->setValidator(
        new QRegularExpressionValidator(QRegularExpression(QStringLiteral("[0-9]{0,%1}").arg(kMaxDigits)), m_edit));
    m_edit->setMaxLength(kMaxDigits);
    m_edit->installEventFilter(this);
    setFocusProxy(m_edit);
    setFocusPolicy(m_edit->focusPolicy());
    connect(m_up, &QToolButton::clicked, this, [this] { StepBy(1); });
    connect(m_down, &QToolButton::clicked, this, [this] { StepBy(-1); });
    connect(m_edit, &QLineEdit::textEdited, this, &ToSpinEdit::valueEdited);
}

void ToSpinEdit::SetRange(std::uint32_t minimum, std::uint32_t maximum)
{
    m_minimum = std::min(minimum, maximum);
    m_maximum = std::max(minimum, maximum);
}

std::optional<std::uint32_t> ToSpinEdit::Value() const
{
    bool ok = false;
    const qulonglong value = m_edit->text().toULongLong(&ok);
    if (!ok || value > std::numeric_limits<std::uint32_t>::max())
        return std::nullopt;
    return std::uint32_t(value);
}

void ToSpinEdit::SetValue(std::uint32_t value)
{
    m_edit->setText(QString::number(value));
}

void ToSpinEdit::StepBy(int steps)
{
    if (steps == 0)
        return;
    const std::optional<std::uint32_t> current = Value();
    long long next = 0;
    if (current)
        next = static_cast<long long>(*current) + steps;
    else
        next = steps > 0 ? m_minimum : m_maximum;
    next = std::clamp<long long>(next, m_minimum, m_maximum);
    SetValue(std::uint32_t(next));
    m_edit->selectAll();
    emit valueEdited();
}

void ToSpinEdit::resizeEvent(QResizeEvent *event)
{
    QWidget::resizeEvent(event);
    const int buttonWidth = std::max(12, height() * 3 / 4);
    const int upHeight = height() / 2;
    m_edit->setGeometry(0, 0, std::max(0, width() - buttonWidth), height());
    m_up->setGeometry(width() - buttonWidth, 0, buttonWidth, upHeight);
    m_down->setGeometry(width() - buttonWidth, upHeight, buttonWidth, height() - upHeight);
}

bool ToSpinEdit::eventFilter(QObject *watched, QEvent *event)
{
    if (watched == m_edit && event->type() == QEvent::KeyPress) {
        const auto *key = static_cast<QKeyEvent *>(event);
        if (key->modifiers() == Qt::NoModifier && (key->key() == Qt::Key_Up || key->key() == Qt::Key_Down)) {
            StepBy(key->key() == Qt::Key_Up ? 1 : -1);
            return true;
        }
    }
    return QWidget::eventFilter(watched, event);
}

} // namespace sharedsource
