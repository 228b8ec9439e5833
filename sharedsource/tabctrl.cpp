#include "sharedsource/tabctrl.h"

#include <QKeyEvent>
#include <QMouseEvent>
#include <QStackedWidget>
#include <QTabBar>
#include <QWheelEvent>

#include <algorithm>
#include <vector>

namespace sharedsource {

ToTabCtrl::ToTabCtrl(QWidget *parent) : QTabWidget(parent)
{
    // The strip changes pages on its own; every such change goes through the leave check.
    tabBar()->installEventFilter(this);
}

int ToTabCtrl::NextEnabledPage(int from, int step) const
{
    for (int index = from + step; index >= 0 && index < count(); index += step) {
        if (isTabEnabled(index))
            return index;
    }
    return -1;
}

bool ToTabCtrl::RequestPage(int index)
{
    if (index < 0 || index >= count() || index == currentIndex() || !isTabEnabled(index))
        return false;
    if (currentIndex() >= 0 && !CanLeavePage(currentIndex()))
        return false;
    setCurrentIndex(index);
    return true;
}

bool ToTabCtrl::SelectNextPage(bool backwards)
{
    return RequestPage(NextEnabledPage(currentIndex(), backwards ? -1 : 1));
}

bool ToTabCtrl::CanLeavePage(int)
{
    return true;
}

void ToTabCtrl::keyPressEvent(QKeyEvent *event)
{
    const bool ctrl = event->modifiers() & Qt::ControlModifier;
    const bool tab = event->key() == Qt::Key_Tab || event->key() == Qt::Key_Backtab;
    const bool page = event->key() == Qt::Key_PageUp || event->key() == Qt::Key_PageDown;
    if (ctrl && (tab || page)) {
        if (m_keyboardSwitching) {
            const bool backwards = event->key() == Qt::Key_Backtab || event->key() == Qt::Key_PageUp ||
                                   (tab && (event->modifiers() & Qt::ShiftModifier));
            SelectNextPage(backwards);
        }
        event->accept();
        return;
    }
    QTabWidget::keyPressEvent(event);
}

bool ToTabCtrl::eventFilter(QObject *watched, QEvent *event)
{
    if (watched != tabBar())
        return QTabWidget::eventFilter(watched, event);
    switch (event->type()) {
    case QEvent::MouseButtonPress:
    case QEvent::MouseButtonDblClick: {
        const auto *mouse = static_cast<QMouseEvent *>(event);
        if (mouse->button() != Qt::LeftButton)
            break;
        const int index = tabBar()->tabAt(mouse->position().toPoint());
        if (index < 0 || index == currentIndex() || !isTabEnabled(index))
            break;
        RequestPage(index);
        return true;
    }
    case QEvent::KeyPress: {
        const auto *key = static_cast<QKeyEvent *>(event);
        if (key->modifiers() & (Qt::ControlModifier | Qt::AltModifier))
            break;
        int step = 0;
        if (key->key() == Qt::Key_Left || key->key() == Qt::Key_Up)
            step = -1;
        else if (key->key() == Qt::Key_Right || key->key() == Qt::Key_Down)
            step = 1;
        if (step == 0)
            break;
        if (isRightToLeft() && (key->key() == Qt::Key_Left || key->key() == Qt::Key_Right))
            step = -step;
        RequestPage(NextEnabledPage(currentIndex(), step));
        return true;
    }
    case QEvent::Wheel: {
        const auto *wheel = static_cast<QWheelEvent *>(event);
        const int delta = wheel->angleDelta().y() ? wheel->angleDelta().y() : wheel->angleDelta().x();
        if (delta != 0)
            RequestPage(NextEnabledPage(currentIndex(), delta > 0 ? -1 : 1));
        return true;
    }
    default:
        break;
    }
    return QTabWidget::eventFilter(watched, event);
}

void FollowTabStrip(QTabWidget &tabs, QWidget &page)
{
    // The page's controls in their own order, after the strip and after the
    // pages added before it.
    QWidget *previous = tabs.tabBar();
    for (int i = 0; i < tabs.count(); ++i) {
        QWidget *added = tabs.widget(i);
        if (added == &page)
            break;
        for (QWidget *w = added->nextInFocusChain(); w && added->isAncestorOf(w); w = w->nextInFocusChain())
            previous = w;
    }
    // Each control that takes the focus moves with what lies inside it.
    std::vector<QWidget *> controls;
    for (QWidget *w = page.nextInFocusChain(); w && w != &page; w = w->nextInFocusChain()) {
        const bool inside = std::any_of(controls.begin(), controls.end(),
                                        [w](const QWidget *control) { return control->isAncestorOf(w); });
        if (page.isAncestorOf(w) && w->focusPolicy() != Qt::NoFocus && !inside)
            controls.push_back(w);
    }
    for (QWidget *control : controls) {
        QWidget::setTabOrder(previous, control);
        previous = control;
    }
}

ToTabCtrl *TabCtrlOfPage(const QWidget *page)
{
    const QWidget *stack = page ? page->parentWidget() : nullptr;
    if (!qobject_cast<const QStackedWidget *>(stack))
        return nullptr;
    return qobject_cast<ToTabCtrl *>(stack->parentWidget());
}

} // namespace sharedsource
