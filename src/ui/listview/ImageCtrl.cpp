#include "ui/listview/ImageCtrl.h"

#include "ui/listview/ListConstants.h"

#include <QMouseEvent>
#include <QPainter>

namespace Brimvault {

namespace {

qint16 buttonCode(Qt::MouseButtons buttons)
{
    return qint16((buttons & Qt::LeftButton ? 1 : 0) | (buttons & Qt::RightButton ? 2 : 0)
        | (buttons & Qt::MiddleButton ? 4 : 0));
}

qint16 shiftCode(Qt::KeyboardModifiers modifiers)
{
    return qint16((modifiers & Qt::ShiftModifier ? 1 : 0) | (modifiers & Qt::ControlModifier ? 2 : 0)
        | (modifiers & Qt::AltModifier ? 4 : 0));
}

} // namespace

ImageCtrl::ImageCtrl(QWidget* parent)
    : QWidget(parent)
{
    setAttribute(Qt::WA_OpaquePaintEvent);
    // Moves are passed on with no button held too, as the platform's control reports them.
    setMouseTracking(true);
    m_face.setBackColor(palette().color(QPalette::Button).rgb());
    resize(ListGrid::IconSize, ListGrid::IconSize);
}

ImageCtrl::~ImageCtrl() = default;

void ImageCtrl::SetData(const QString& value)
{
    m_data = value;
}

QString ImageCtrl::Data() const
{
    return m_data;
}

void ImageCtrl::SetPicture(const QPixmap& picture)
{
    m_face.setPicture(picture);
    if (!picture.isNull())
        update();
}

QPixmap ImageCtrl::Picture() const
{
    return m_face.picture();
}

QPaintDevice* ImageCtrl::hdc()
{
    return this;
}

void ImageCtrl::SetBackColor(const QColor& color)
{
    m_face.setBackColor(color.rgb());
    update();
}

QColor ImageCtrl::BackColor() const
{
    return QColor::fromRgb(m_face.backColor());
}

QSize ImageCtrl::sizeHint() const
{
    return {ListGrid::IconSize, ListGrid::IconSize};
}

void ImageCtrl::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    if (width() > ListGrid::IconSize || height() > ListGrid::IconSize)
        painter.fillRect(rect(), QColor::fromRgb(m_face.backColor()));
    m_face.paint(painter, QPoint(0, 0));
}

void ImageCtrl::mousePressEvent(QMouseEvent* event)
{
    const QPointF at = event->position();
    Q_EMIT MouseDown(buttonCode(event->button()), shiftCode(event->modifiers()), float(at.x()), float(at.y()));
}

void ImageCtrl::mouseMoveEvent(QMouseEvent* event)
{
    const QPointF at = event->position();
    Q_EMIT MouseMove(buttonCode(event->buttons()), shiftCode(event->modifiers()), float(at.x()), float(at.y()));
}

void ImageCtrl::mouseReleaseEvent(QMouseEvent* event)
{
    const QPointF at = event->position();
    Q_EMIT MouseUp(buttonCode(event->button()), shiftCode(event->modifiers()), float(at.x()), float(at.y()));
    if (rect().contains(at.toPoint()))
        Q_EMIT Click();
}

void ImageCtrl::mouseDoubleClickEvent(QMouseEvent*)
{
    Q_EMIT DblClick();
}

} // namespace Brimvault
