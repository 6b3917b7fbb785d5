#include "ui/main/FormScaling.h"

#include <QWidget>

#include <cmath>

namespace Brimvault::FormScaling {

namespace {

QRect scaled(const QRect& rect, Factors factors)
{
    return {int(std::lround(rect.x() * factors.x)), int(std::lround(rect.y() * factors.y)),
        int(std::lround(rect.width() * factors.x)), int(std::lround(rect.height() * factors.y))};
}

void scaleFont(QWidget* control, double factor)
{
    QFont font = control->font();
    if (font.pointSizeF() <= 0)
        return;
    font.setPointSizeF(font.pointSizeF() * factor);
    control->setFont(font);
}

} // namespace

TwipsPerPixel ScreenTwipsPerPixel(const QWidget* widget)
{
    const int dpiX = widget ? widget->logicalDpiX() : 96;
    const int dpiY = widget ? widget->logicalDpiY() : 96;
    return {dpiX > 0 ? 1440.0 / dpiX : DesignTwipsPerPixel, dpiY > 0 ? 1440.0 / dpiY : DesignTwipsPerPixel};
}

int TwipsToPixelsX(double twips, TwipsPerPixel screen)
{
    return int(std::lround(twips / screen.x));
}

int TwipsToPixelsY(double twips, TwipsPerPixel screen)
{
    return int(std::lround(twips / screen.y));
}

QRect TwipsToPixels(const QRect& twips, TwipsPerPixel screen)
{
    return {TwipsToPixelsX(twips.x(), screen), TwipsToPixelsY(twips.y(), screen), TwipsToPixelsX(twips.width(), screen),
        TwipsToPixelsY(twips.height(), screen)};
}

Factors ScreenFactors(TwipsPerPixel screen)
{
    return {screen.x / DesignTwipsPerPixel, screen.y / DesignTwipsPerPixel};
}

void ScaleForm(QWidget* form, Factors factors)
{
    if (!form || factors.isIdentity())
        return;
    // A window's position is that of its frame; its size is the client's.
    const QRect window(form->pos(), form->size());
    const QRect scaledWindow = scaled(window, factors);
    form->move(scaledWindow.topLeft());
    form->resize(scaledWindow.size());

    const QList<QWidget*> controls = form->findChildren<QWidget*>(Qt::FindDirectChildrenOnly);
    for (QWidget* control : controls) {
        if (control->isWindow())
            continue;
        control->setGeometry(scaled(control->geometry(), factors));
        scaleFont(control, factors.x);
    }
}

} // namespace Brimvault::FormScaling
