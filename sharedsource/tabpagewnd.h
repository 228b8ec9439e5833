#pragma once

// A dialog that lives as a page in a ToTabCtrl: Tab walks through the
// page's controls and then out of the page to what follows the tab control;
// Ctrl+Tab and Ctrl+Shift+Tab switch pages. A page never closes or hides
// itself on Enter or Escape: it either keeps them for its focused control
// or lets them reach the dialog around it (its default button, Cancel).
// F1 goes to the dialog, which knows the help topic of the current page.

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

// Where Enter and Escape go once the page's focused control has had them.
enum class DialogKeys
{
    KeptByPage,  // they never close the dialog from this page
    ReachDialog, // they reach the dialog's OK and Cancel
};

namespace tabpage {

// What both operations do, apart from the class template.
bool FocusNextControl(QWidget &page, QWidget *current);
// True when the key press was a page switch and is consumed.
bool HandleCtrlTab(QWidget &page, QKeyEvent &event);
// True when the page decides where Tab goes (a forward Tab inside a tab
// control that accepts keyboard handling).
bool HandlesTab(const QWidget &page, bool forward);
// True when the key is Enter, Escape or F1, which a page never handles as
// a dialog would; the event is accepted or ignored as keys says.
bool HandleDialogKey(QKeyEvent &event, DialogKeys keys);

} // namespace tabpage

template <class Base>
class ToTabPageWnd : public Base, public ITabPageNavigation
{
public:
    ToTabPageWnd(QWidget *parent = nullptr, std::uintptr_t applyContext = 0) : Base(parent, applyContext) {}

    bool FocusNextControl(QWidget *current) override { return tabpage::FocusNextControl(*this, current); }

    void SetDialogKeys(DialogKeys keys) { m_dialogKeys = keys; }
    DialogKeys GetDialogKeys() const { return m_dialogKeys; }

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
        if (tabpage::HandleCtrlTab(*this, *event) || tabpage::HandleDialogKey(*event, m_dialogKeys))
            return;
        Base::keyPressEvent(event);
    }

    // A page is embedded, never a window of its own to end.
    void accept() override {}
    void reject() override {}

private:
    DialogKeys m_dialogKeys = DialogKeys::KeptByPage;
};

} // namespace sharedsource
