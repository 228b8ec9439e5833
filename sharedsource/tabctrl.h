#pragma once

// The tab control that holds tab pages: whether its pages handle Tab and
// Ctrl+Tab themselves, page switching that skips disabled pages and stops
// at both ends, and a leave check before every change of page the user
// asks for (a click on a tab, the keys of the tab strip, Ctrl+Tab and
// Ctrl+Shift+Tab, Ctrl+PageUp and Ctrl+PageDown, the mouse wheel).

#include <QTabWidget>

namespace sharedsource {

class ToTabCtrl : public QTabWidget
{
    Q_OBJECT

public:
    explicit ToTabCtrl(QWidget *parent = nullptr);

    void SetKeyboardHandling(bool accepts) { m_keyboardHandling = accepts; }
    bool AcceptsKeyboardHandling() const { return m_keyboardHandling; }
    void SetKeyboardSwitching(bool allows) { m_keyboardSwitching = allows; }
    bool AllowsKeyboardSwitching() const { return m_keyboardSwitching; }

    // Selects the next (or previous) enabled page; false at either end or
    // when the current page may not be left. currentChanged is the
    // selection-change notification.
    bool SelectNextPage(bool backwards);
    // Selects page index for the user: false when it is the current one,
    // cannot be selected, or the current page may not be left.
    bool RequestPage(int index);

protected:
    // Asked before the user leaves page index; false keeps it.
    virtual bool CanLeavePage(int index);

    void keyPressEvent(QKeyEvent *event) override;
    bool eventFilter(QObject *watched, QEvent *event) override;

private:
    int NextEnabledPage(int from, int step) const;

    bool m_keyboardHandling = true;
    bool m_keyboardSwitching = true;
};

// Puts the page's controls right after the tab strip (and the pages added
// before it) in the dialog's focus order, where Tab reaches them from the strip.
void FollowTabStrip(QTabWidget &tabs, QWidget &page);

// The tab control a page sits in (its stack's parent), or null.
ToTabCtrl *TabCtrlOfPage(const QWidget *page);

} // namespace sharedsource
