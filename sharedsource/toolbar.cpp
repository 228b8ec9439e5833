#include "sharedsource/toolbar.h"

#include "sharedsource/imageset.h"
#include "sharedsource/reportlist.h"

#include <QToolButton>

#include <algorithm>

namespace sharedsource {

namespace {

// A button is its image plus a frame, as toolbar buttons have always been.
constexpr QSize kButtonFrame(7, 6);
constexpr int kRightOverhang = 4;
constexpr int kExtraWidth = 13;
constexpr int kExtraHeight = 7;
constexpr int kInnerTop = 4;

} // namespace

ToToolBar::ToToolBar(const QString &imageSet, const std::vector<ToolButton> &buttons, QWidget *parent) : QWidget(parent)
{
    const int count = int(buttons.size());
    const QList<QPixmap> images = SplitImageStrip(LoadImage(imageSet, logicalDpiY()), count);
    QSize imageSize(16, 16);
    if (!images.isEmpty())
        imageSize = images.front().size() / images.front().devicePixelRatio();
    m_buttonSize = imageSize + kButtonFrame;

    for (int i = 0; i < count; ++i) {
        auto *button = new QToolButton(this);
        button->setAutoRaise(true);
        button->setFocusPolicy(Qt::NoFocus);
        button->setToolTip(buttons[std::size_t(i)].toolTip);
        button->setAccessibleName(buttons[std::size_t(i)].toolTip);
        if (i < images.size())
            button->setIcon(images[i]);
        button->setIconSize(imageSize);
        const int command = buttons[std::size_t(i)].command;
        connect(button, &QToolButton::clicked, this, [this, command] { emit commandTriggered(command); });
        m_buttons.push_back({command, button});
    }
    LayOutButtons(kExtraWidth - kRightOverhang, kInnerTop);
    resize(count * m_buttonSize.width() + kExtraWidth, m_buttonSize.height() + kExtraHeight);
}

void ToToolBar::LayOutButtons(int left, int top)
{
    for (std::size_t i = 0; i < m_buttons.size(); ++i)
        m_buttons[i].button->setGeometry(left + int(i) * m_buttonSize.width(), top, m_buttonSize.width(),
                                         m_buttonSize.height());
}

QToolButton *ToToolBar::Button(int command) const
{
    for (const Entry &entry : m_buttons) {
        if (entry.command == command)
            return entry.button;
    }
    return nullptr;
}

void ToToolBar::SetButtonEnabled(int command, bool enabled)
{
    if (QToolButton *button = Button(command))
        button->setEnabled(enabled);
}

bool ToToolBar::IsButtonEnabled(int command) const
{
    const QToolButton *button = Button(command);
    return button && button->isEnabled();
}

void ToToolBar::SetToolTip(int command, const QString &toolTip)
{
    if (QToolButton *button = Button(command))
        button->setToolTip(toolTip);
}

void ToToolBar::Place(const QRect &placeholder, ToolBarPlacement placement)
{
    if (placement == ToolBarPlacement::Over) {
        LayOutButtons(0, std::max(0, (placeholder.height() - m_buttonSize.height()) / 2));
        setGeometry(placeholder);
        return;
    }
    LayOutButtons(kExtraWidth - kRightOverhang, kInnerTop);
    const int width = ButtonCount() * m_buttonSize.width() + kExtraWidth;
    const int height = m_buttonSize.height() + kExtraHeight;
    // QRect's right() and bottom() are the last pixel inside: the edge is one further.
    const int right = placeholder.x() + placeholder.width() + kRightOverhang;
    const int bottom = placeholder.y() + placeholder.height();
    setGeometry(right - width, bottom - height, width, height);
}

} // namespace sharedsource
