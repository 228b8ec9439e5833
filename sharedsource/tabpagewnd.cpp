#include "sharedsource/tabpagewnd.h"

#include <QApplication>

#include <vector>

namespace sharedsource::tabpage {

namespace {

bool TakesTabFocus(const QWidget *widget)
{
    return widget->isVisibleTo(widget->window()) && widget->isEnabled() &&
           (widget->focusPolicy() & Qt::TabFocus) == Qt::TabFocus;
}

// The page's controls in focus order.
std::vector<QWidget *> FocusOrder(QWidget &page)
{
    std::vector<QWidget *> order;
    for (QWidget *w = page.nextInFocusChain(); w && w != &page; w = w->nextInFocusChain()) {
        if (page.isAncestorOf(w) && TakesTabFocus(w))
            order.push_back(w);
    }
    return order;
}

// Leaves the tab control: to the next control of the enclosing page, or of the dialog.
bool LeaveTabCtrl(ToTabCtrl &tabs)
{
    QWidget *outer = tabs.parentWidget();
    if (auto *outerPage = dynamic_cast<ITabPageNavigation *>(outer); outerPage && TabCtrlOfPage(outer))
        return outerPage->FocusNextControl(&tabs);
    for (QWidget *w = tabs.nextInFocusChain(); w && w != &tabs; w = w->nextInFocusChain()) {
        if (tabs.isAncestorOf(w) || w->window() != tabs.window() || !TakesTabFocus(w))
            continue;
        w->setFocus(Qt::TabFocusReason);
        return true;
    }
    return false;
}

} // namespace

bool HandlesTab(const QWidget &page, bool forward)
{
    const ToTabCtrl *tabs = TabCtrlOfPage(&page);
    return forward && tabs && tabs->AcceptsKeyboardHandling();
}

bool FocusNextControl(QWidget &page, QWidget *current)
{
    const std::vector<QWidget *> order = FocusOrder(page);
    // The position of current; a control holding current (an inner tab
    // control handing on) counts with everything inside it.
    std::ptrdiff_t at = -1;
    if (current && current != &page) {
        for (std::size_t i = 0; i < order.size(); ++i) {
            if (order[i] == current || order[i]->isAncestorOf(current) || current->isAncestorOf(order[i]))
                at = std::ptrdiff_t(i);
        }
    }
    if (std::size_t(at + 1) < order.size()) {
        order[std::size_t(at + 1)]->setFocus(Qt::TabFocusReason);
        return true;
    }
    ToTabCtrl *tabs = TabCtrlOfPage(&page);
    return tabs && LeaveTabCtrl(*tabs);
}

bool HandleDialogKey(QKeyEvent &event, DialogKeys keys)
{
    const bool enter = event.key() == Qt::Key_Return || event.key() == Qt::Key_Enter;
    const bool escape = event.key() == Qt::Key_Escape;
    if (event.key() == Qt::Key_F1) {
        event.ignore();
        return true;
    }
    if (!enter && !escape)
        return false;
    if (keys == DialogKeys::ReachDialog)
        event.ignore();
    else
        event.accept();
    return true;
}

bool HandleCtrlTab(QWidget &page, QKeyEvent &event)
{
    const bool tab = event.key() == Qt::Key_Tab || event.key() == Qt::Key_Backtab;
    if (!tab || !(event.modifiers() & Qt::ControlModifier))
        return false;
    ToTabCtrl *tabs = TabCtrlOfPage(&page);
    if (!tabs || !tabs->AcceptsKeyboardHandling())
        return false;
    if (tabs->AllowsKeyboardSwitching())
        tabs->SelectNextPage(event.key() == Qt::Key_Backtab || (event.modifiers() & Qt::ShiftModifier));
    event.accept();
    return true;
}

} // namespace sharedsource::tabpage
