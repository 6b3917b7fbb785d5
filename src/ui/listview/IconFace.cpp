#include "ui/listview/IconFace.h"

#include "ui/listview/ListConstants.h"

#include <QPainter>

#include <utility>

namespace Brimvault {

const QPixmap& IconFace::picture() const
{
    makePicture();
    return m_picture;
}

const QPixmap& IconFace::shownPicture() const
{
    makePicture();
    return m_shown;
}

void IconFace::setPicture(const QPixmap& picture)
{
    m_source = nullptr;
    m_picture = picture;
    if (!picture.isNull())
        m_shown = picture;
}

void IconFace::setPictureSource(PictureSource source)
{
    m_source = std::move(source);
    m_picture = QPixmap();
}

void IconFace::setPictureOf(const IconFace& other)
{
    if (other.m_source)
        setPictureSource(other.m_source);
    else
        setPicture(other.m_picture);
}

void IconFace::makePicture() const
{
    if (!m_source)
        return;
    const PictureSource source = std::exchange(m_source, nullptr);
    m_picture = source();
    if (!m_picture.isNull())
        m_shown = m_picture;
}

void IconFace::setBackColor(QRgb color)
{
    m_backColor = color;
    m_shown = m_picture;
}

void IconFace::paint(QPainter& painter, const QPoint& origin) const
{
    const QRect surface(origin, QSize(ListGrid::IconSize, ListGrid::IconSize));
    painter.fillRect(surface, QColor::fromRgb(m_backColor));
    makePicture();
    if (m_shown.isNull())
        return;
    const QSize logical = m_shown.deviceIndependentSize().toSize();
    if (logical == surface.size()) {
        painter.drawPixmap(origin, m_shown);
        return;
    }
    // Pictures of another size are drawn at the standard icon size, as the system's icon call does.
    painter.save();
    painter.setRenderHint(QPainter::SmoothPixmapTransform);
    painter.drawPixmap(surface, m_shown);
    painter.restore();
}

} // namespace Brimvault
