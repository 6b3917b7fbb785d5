#include "clsFormFuncs.h"

#include <QGuiApplication>
#include <QScreen>
#include <QWidget>

#include <algorithm>

namespace Brimvault {

clsFormFuncs::clsFormFuncs(QObject* parent)
    : QObject(parent)
{ }

void clsFormFuncs::CenterForm(QObject* frm)
{
    auto* widget = qobject_cast<QWidget*>(frm);
    if (!widget)
        return;
    QWidget* window = widget->window();
    QScreen* screen = window->screen() ? window->screen() : QGuiApplication::primaryScreen();
    if (!screen)
        return;
    const QRect area = screen->availableGeometry();
    // Before the first show the frame is not known yet and equals the client geometry.
    const QSize frame = window->frameGeometry().size();
    const int left = std::max(area.left(), area.left() + (area.width() - frame.width()) / 2);
    const int top = std::max(area.top(), area.top() + (area.height() - frame.height()) / 2);
    window->move(left, top);
}

} // namespace Brimvault
