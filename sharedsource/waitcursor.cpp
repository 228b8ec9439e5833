#include "sharedsource/waitcursor.h"

#include <QCursor>
#include <QGuiApplication>

namespace sharedsource {

namespace {

bool HasGui()
{
    return qobject_cast<QGuiApplication *>(QCoreApplication::instance()) != nullptr;
}

} // namespace

void BeginWaitCursor()
{
    if (HasGui())
        QGuiApplication::setOverrideCursor(QCursor(Qt::WaitCursor));
}

void EndWaitCursor()
{
    if (HasGui() && QGuiApplication::overrideCursor())
        QGuiApplication::restoreOverrideCursor();
}

} // namespace sharedsource
