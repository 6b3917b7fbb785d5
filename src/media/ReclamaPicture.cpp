#include "media/ReclamaPicture.h"

#include <QImage>
#include <QLinearGradient>
#include <QPainter>

namespace Brimvault::ReclamaPicture {

QColor SurroundingColour(const QImage& picture, const QColor& fallback)
{
    const int width = picture.width();
    const int height = picture.height();
    const int step = width / 100;
    if (height <= 60 || step <= 0)
        return fallback;
    qint64 red = 0, green = 0, blue = 0, count = 0;
    for (const int y : {30, height - 31}) {
        for (int k = 0; k < 100; ++k) {
            const int x = 30 + k * step;
            if (x >= width)
                break;
            const QColor colour = picture.pixelColor(x, y);
            red += colour.red();
            green += colour.green();
            blue += colour.blue();
            ++count;
        }
    }
    if (count == 0)
        return fallback;
    return QColor(int(red / count), int(green / count), int(blue / count));
}

void PaintPicture(QPainter& painter, const QRect& area, const QImage& picture, const QColor& surrounding)
{
    const QColor shade(surrounding.red() / 2, surrounding.green() / 2, surrounding.blue() / 2);
    QLinearGradient gradient(area.topLeft(), area.bottomLeft());
    gradient.setColorAt(0.0, surrounding);
    gradient.setColorAt(1.0, shade);
    painter.fillRect(area, gradient);

    const QSize fits = picture.size().boundedTo(area.size()) == picture.size()
        ? picture.size()
        : picture.size().scaled(area.size(), Qt::KeepAspectRatio);
    const QRect target(
        area.topLeft() + QPoint((area.width() - fits.width()) / 2, (area.height() - fits.height()) / 2), fits);
    painter.setRenderHint(QPainter::SmoothPixmapTransform);
    painter.drawImage(target, picture);
}

} // namespace Brimvault::ReclamaPicture
