#pragma once

// A flat toolbar of image buttons with tool tips, cut from one image strip
// of the module's resources in the set that fits the screen resolution.
// Pages place it by an invisible placeholder of their template, again after
// every layout pass (CNSFlexDialog::PlaceToolBar).

#include <QWidget>

#include <vector>

class QToolButton;

namespace sharedsource {

struct ToolButton
{
    int command = 0;
    QString toolTip;
};

enum class ToolBarPlacement
{
    // Right edge 4 pixels right of the placeholder's, bottom edge on the
    // placeholder's; n button widths plus 13 wide, one button height plus 7 high.
    RightAligned,
    // Exactly the placeholder's rectangle.
    Over,
};

class ToToolBar final : public QWidget
{
    Q_OBJECT

public:
    // imageSet names a strip holding one image per button, in button order.
    ToToolBar(const QString &imageSet, const std::vector<ToolButton> &buttons, QWidget *parent);

    QSize ButtonSize() const { return m_buttonSize; }
    int ButtonCount() const { return int(m_buttons.size()); }
    QToolButton *Button(int command) const;

    // A disabled button shows greyed and does not react.
    void SetButtonEnabled(int command, bool enabled);
    bool IsButtonEnabled(int command) const;
    void SetToolTip(int command, const QString &toolTip);

    void Place(const QRect &placeholder, ToolBarPlacement placement);

signals:
    void commandTriggered(int command);

private:
    void LayOutButtons(int left, int top);

    struct Entry
    {
        int command;
        QToolButton *button;
    };

    std::vector<Entry> m_buttons;
    QSize m_buttonSize;
};

} // namespace sharedsource
