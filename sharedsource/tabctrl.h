#pragma once

// The tab control that holds tab pages: whether its pages handle Tab and
// Ctrl+Tab themselves, and page switching that skips disabled pages and
// stops at both ends.

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

    // Selects the next (or previous) enabled page; false at either end.
    // currentChanged is the selection-change notification.
    bool SelectNextPage(bool backwards);

private:
    bool m_keyboardHandling = true;
    bool m_keyboardSwitching = true;
};

// The tab control a page sits in (its stack's parent), or null.
ToTabCtrl *TabCtrlOfPage(const QWidget *page);

} // namespace sharedsource
