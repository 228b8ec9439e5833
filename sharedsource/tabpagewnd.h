#pragma once

// A dialog that lives as a page in a ToTabCtrl: Tab walks through the
// page's controls and then out of the page to what follows the tab control;
// Ctrl+Tab and Ctrl+Shift+Tab switch pages.

#include "sharedsource/tabctrl.h"

#include <QApplication>
#include <QKeyEvent>

#include <cstdint>

namespace sharedsource {

// The navigation every page offers, so that a page inside a page can hand
// the focus on to its outer page.
class ITabPageNavigation
{
public:
    // Moves the focus to the control after current; false when nothing
    // took the focus.
    virtual bool FocusNextControl(QWidget *current) = 0;

protected:
    ~ITabPageNavigation() = default;
};

namespace tabpage {

// What both operations do, apart from the class template.
bool FocusNextControl(QWidget &page, QWidget *current);
// True when the key press was a page switch and is consumed.
bool HandleCtrlTab(QWidget &page, QKeyEvent &event);
// True when the page decides where Tab goes (a forward Tab inside a tab
// control that accepts keyboard handling).
bool HandlesTab(const QWidget &page, bool forward);

} // namespace tabpage

template <class Base>
class ToTabPageWnd : public Base, public ITabPageNavigation
{
public:
    ToTabPageWnd(QWidget *parent = nullptr, std::uintptr_t applyContext = 0) : Base(parent, applyContext) {}

    bool FocusNextControl(QWidget *current) override { return tabpage::FocusNextControl(*this, current); }

protected:
    // Qt hands Tab from the focused control up through its parents to here.
    bool focusNextPrevChild(bool next) override
    {
        if (!tabpage::HandlesTab(*this, next))
            return Base::focusNextPrevChild(next);
        return FocusNextControl(QApplication::focusWidget()) || Base::focusNextPrevChild(next);
    }

    void keyPressEvent(QKeyEvent *event) override
    {
        if (tabpage::HandleCtrlTab(*this, *event))
            return;
        Base::keyPressEvent(event);
    }
};

} // namespace sharedsource
