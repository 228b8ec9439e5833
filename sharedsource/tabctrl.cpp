#include "sharedsource/tabctrl.h"

#include <QStackedWidget>

namespace sharedsource {

ToTabCtrl::ToTabCtrl(QWidget *parent) : QTabWidget(parent) {}

bool ToTabCtrl::SelectNextPage(bool backwards)
{
    const int step = backwards ? -1 : 1;
    for (int index = currentIndex() + step; index >= 0 && index < count(); index += step) {
        if (isTabEnabled(index)) {
            setCurrentIndex(index);
            return true;
        }
    }
    return false;
}

ToTabCtrl *TabCtrlOfPage(const QWidget *page)
{
    const QWidget *stack = page ? page->parentWidget() : nullptr;
    if (!qobject_cast<const QStackedWidget *>(stack))
        return nullptr;
    return qobject_cast<ToTabCtrl *>(stack->parentWidget());
}

} // namespace sharedsource
