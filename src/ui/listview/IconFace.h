#pragma once

#include <QPixmap>
#include <QRgb>

#include <functional>

class QPainter;
class QPoint;

namespace Brimvault {

// What an icon surface shows: its background colour and the picture last drawn on it. Setting an empty
// picture keeps what is drawn; only a new picture or a new background colour clears the surface.
class IconFace {
public:
    // Makes a picture when it is first needed.
    using PictureSource = std::function<QPixmap()>;

    const QPixmap& picture() const;
    void setPicture(const QPixmap& picture);
    // A long list decodes only the pictures that are painted or asked for.
    void setPictureSource(PictureSource source);
    // The picture of another face, made or still to be made.
    void setPictureOf(const IconFace& other);

    QRgb backColor() const { return m_backColor; }
    void setBackColor(QRgb color);

    const QPixmap& shownPicture() const;

    // Paints the 32 x 32 surface with its top-left corner at origin.
    void paint(QPainter& painter, const QPoint& origin) const;

private:
    void makePicture() const;

    mutable PictureSource m_source;
    mutable QPixmap m_picture;
    mutable QPixmap m_shown;
    QRgb m_backColor = qRgb(240, 240, 240);
};

} // namespace Brimvault
