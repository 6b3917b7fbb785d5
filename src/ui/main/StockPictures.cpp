#include "ui/main/StockPictures.h"

#include <QGuiApplication>
#include <QIcon>
#include <QLinearGradient>
#include <QPainter>
#include <QPainterPath>
#include <QPixmap>
#include <QRadialGradient>

#include <cmath>
#include <functional>
#include <numbers>

namespace Brimvault::StockPictures {

namespace {

// Every picture is drawn on a 32-unit canvas and scaled to the size asked for, in the screen's real pixels.
QPixmap drawn(int size, const std::function<void(QPainter&)>& draw)
{
    const qreal ratio = qApp ? qApp->devicePixelRatio() : 1.0;
    QPixmap picture(QSize(size, size) * ratio);
    picture.setDevicePixelRatio(ratio);
    picture.fill(Qt::transparent);
    QPainter painter(&picture);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.scale(size / 32.0, size / 32.0);
    draw(painter);
    return picture;
}

QLinearGradient vertical(QRgb top, QRgb bottom, qreal from = 0, qreal to = 32)
{
    QLinearGradient gradient(0, from, 0, to);
    gradient.setColorAt(0, QColor(top));
    gradient.setColorAt(1, QColor(bottom));
    return gradient;
}

void drawGamepad(QPainter& painter, const QRectF& body, QColor bodyColor, QColor detailColor)
{
    QPainterPath pad;
    const qreal r = body.height() / 2;
    pad.addRoundedRect(body, r, r);
    painter.setPen(Qt::NoPen);
    painter.setBrush(bodyColor);
    painter.drawPath(pad);

    // Cross on the left, two buttons on the right.
    const QPointF cross(body.left() + r, body.center().y());
    const qreal arm = body.height() * 0.32;
    const qreal thick = body.height() * 0.16;
    painter.setBrush(detailColor);
    painter.drawRect(QRectF(cross.x() - arm, cross.y() - thick / 2, arm * 2, thick));
    painter.drawRect(QRectF(cross.x() - thick / 2, cross.y() - arm, thick, arm * 2));
    const qreal dot = body.height() * 0.2;
    const QPointF buttons(body.right() - r, body.center().y());
    painter.drawEllipse(QPointF(buttons.x() - dot * 0.9, buttons.y() + dot * 0.5), dot / 2 + 0.4, dot / 2 + 0.4);
    painter.drawEllipse(QPointF(buttons.x() + dot * 0.6, buttons.y() - dot * 0.6), dot / 2 + 0.4, dot / 2 + 0.4);
}

} // namespace

QPixmap OnlineGames(int size)
{
    return drawn(size, [](QPainter& painter) {
        QRadialGradient sea(QPointF(12, 10), 22);
        sea.setColorAt(0, QColor(120, 200, 255));
        sea.setColorAt(1, QColor(20, 90, 180));
        painter.setPen(QPen(QColor(15, 60, 130), 1));
        painter.setBrush(sea);
        painter.drawEllipse(QRectF(2.5, 2.5, 27, 27));

        painter.setPen(QPen(QColor(255, 255, 255, 170), 1.2));
        painter.setBrush(Qt::NoBrush);
        painter.drawEllipse(QRectF(9.5, 2.5, 13, 27));
        painter.drawLine(QPointF(16, 2.5), QPointF(16, 29.5));
        painter.drawLine(QPointF(2.5, 16), QPointF(29.5, 16));
        painter.drawArc(QRectF(4, 5, 24, 8), 0, 180 * 16);
        painter.drawArc(QRectF(4, 19, 24, 8), 180 * 16, 180 * 16);

        painter.setPen(Qt::NoPen);
        painter.setBrush(QColor(255, 255, 255, 90));
        painter.drawEllipse(QRectF(7, 5, 10, 6));
    });
}

QPixmap FlashMovie(int size)
{
    return drawn(size, [](QPainter& painter) {
        painter.setPen(QPen(QColor(130, 10, 10), 1));
        painter.setBrush(vertical(qRgb(240, 70, 60), qRgb(170, 20, 20)));
        painter.drawRoundedRect(QRectF(2.5, 2.5, 27, 27), 6, 6);

        QPainterPath letter;
        letter.moveTo(21, 8);
        letter.cubicTo(15, 6.5, 13.5, 10, 13.5, 14);
        letter.lineTo(13.5, 25);
        painter.setPen(QPen(Qt::white, 3.2, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
        painter.setBrush(Qt::NoBrush);
        painter.drawPath(letter);
        painter.drawLine(QPointF(10, 15.5), QPointF(19, 15.5));
    });
}

QPixmap NoIcon(int size)
{
    return drawn(size, [](QPainter& painter) {
        painter.setPen(QPen(QColor(60, 70, 90), 1));
        painter.setBrush(vertical(qRgb(250, 250, 252), qRgb(205, 212, 225)));
        painter.drawRoundedRect(QRectF(2.5, 4.5, 27, 23), 3, 3);
        painter.setPen(Qt::NoPen);
        painter.setBrush(vertical(qRgb(90, 130, 200), qRgb(50, 85, 150), 4.5, 9));
        painter.drawRoundedRect(QRectF(3, 5, 26, 4.5), 2, 2);
        drawGamepad(painter, QRectF(7, 13.5, 18, 10), QColor(70, 80, 100), QColor(235, 240, 250));
    });
}

QPixmap GbStels(int size)
{
    return drawn(size, [](QPainter& painter) {
        QPainterPath star;
        for (int i = 0; i < 10; ++i) {
            const qreal radius = i % 2 == 0 ? 14.0 : 6.0;
            const qreal angle = -std::numbers::pi / 2 + i * std::numbers::pi / 5;
            const QPointF point(16 + radius * std::cos(angle), 17 + radius * std::sin(angle));
            if (i == 0)
                star.moveTo(point);
            else
                star.lineTo(point);
        }
        star.closeSubpath();
        painter.setPen(QPen(QColor(160, 100, 0), 1, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
        painter.setBrush(vertical(qRgb(255, 230, 110), qRgb(240, 160, 20), 3, 30));
        painter.drawPath(star);
    });
}

QPixmap ActionsButton(int size)
{
    return drawn(size, [](QPainter& painter) {
        painter.setPen(QPen(QColor(255, 255, 255, 200), 1.2));
        painter.setBrush(vertical(qRgb(255, 196, 70), qRgb(226, 128, 20)));
        painter.drawEllipse(QRectF(2, 2, 28, 28));
        painter.setPen(QPen(Qt::white, 2.6, Qt::SolidLine, Qt::RoundCap));
        for (qreal y : {11.0, 16.0, 21.0})
            painter.drawLine(QPointF(10, y), QPointF(22, y));
    });
}

QIcon ProgramIcon()
{
    QIcon icon;
    for (int size : {16, 24, 32, 48, 64, 128, 256}) {
        icon.addPixmap(drawn(size, [](QPainter& painter) {
            painter.setPen(QPen(QColor(30, 45, 90), 0.8));
            painter.setBrush(vertical(qRgb(112, 142, 208), qRgb(44, 66, 128)));
            painter.drawRoundedRect(QRectF(1.5, 1.5, 29, 29), 7, 7);
            painter.setPen(Qt::NoPen);
            painter.setBrush(QColor(255, 255, 255, 40));
            painter.drawRoundedRect(QRectF(2.5, 2.5, 27, 12), 6, 6);
            drawGamepad(painter, QRectF(5, 11, 22, 12), QColor(255, 196, 70), QColor(44, 66, 128));
        }));
    }
    return icon;
}

} // namespace Brimvault::StockPictures
