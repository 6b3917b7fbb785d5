#include "ui/main/WindowAccessible.h"

#include <QAccessibleWidget>
#include <QWidget>

namespace Brimvault {

namespace {

QAccessibleInterface* windowAccessible(const QString& className, QObject* object)
{
    if (className != u"Brimvault::frmMain" && className != u"Brimvault::frmReclama")
        return nullptr;
    auto* widget = qobject_cast<QWidget*>(object);
    return widget && widget->isWindow() ? new QAccessibleWidget(widget, QAccessible::Window) : nullptr;
}

} // namespace

void InstallWindowAccessibility()
{
    QAccessible::installFactory(&windowAccessible);
}

} // namespace Brimvault
