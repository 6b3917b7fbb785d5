#include "GamePictures.h"

#include <QPainter>
#include <QPainterPath>

QPixmap GamePicture(const QColor& color, QChar letter)
{
    QImage image(32, 32, QImage::Format_ARGB32_Premultiplied);
    image.fill(Qt::transparent);
    QPainter painter(&image);
    painter.setRenderHint(QPainter::Antialiasing);
    QPainterPath path;
    path.addRoundedRect(QRectF(2.5, 2.5, 27, 27), 6, 6);
    painter.fillPath(path, color);
    painter.setPen(color.darker(180));
    painter.drawPath(path);
    QFont font = painter.font();
    font.setBold(true);
    font.setPixelSize(17);
    painter.setFont(font);
    painter.setPen(Qt::white);
    painter.drawText(QRect(2, 2, 28, 28), Qt::AlignCenter, QString(letter));
    painter.end();
    return QPixmap::fromImage(image);
}
