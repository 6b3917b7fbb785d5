#pragma once

#include <QPixmap>
#include <QRgb>

class QPainter;
class QPoint;

namespace Brimvault {

// What an icon surface shows: its background colour and the picture last drawn on it. Setting an empty
// picture keeps what is drawn; only a new picture or a new background colour clears the surface.
class IconFace {
public:
    const QPixmap& picture() const { return m_picture; }
    void setPicture(const QPixmap& picture);

    QRgb backColor() const { return m_backColor; }
    void setBackColor(QRgb color);

    const QPixmap& shownPicture() const { return m_shown; }

    // Paints the 32 x 32 surface with its top-left corner at origin.
    void paint(QPainter& painter, const QPoint& origin) const;

private:
    QPixmap m_picture;
    QPixmap m_shown;
    QRgb m_backColor = qRgb(240, 240, 240);
};

} // namespace Brimvault
