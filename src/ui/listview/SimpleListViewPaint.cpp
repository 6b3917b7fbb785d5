#include "ui/listview/ListConstants.h"
#include "ui/listview/SimpleListView.h"

#include <QPaintEvent>
#include <QPainter>

namespace Brimvault {

void SimpleListView::paintEvent(QPaintEvent* event)
{
    QPainter painter(this);
    const QRect dirty = event->rect();
    painter.fillRect(dirty, m_backColor);
    painter.setFont(m_wrapper.font());

    const int current = isItemShown(m_frame.currentIndex()) ? m_frame.currentIndex() : -1;
    const QRectF area(dirty);
    auto drawCaption = [&](const ListItem& item) {
        const QRectF box = shownCaptionRect(item);
        if (!item.captionVisible || !box.intersects(area) || item.caption.isEmpty())
            return;
        painter.setPen(QColor::fromRgb(item.captionColor));
        const QList<CaptionWrapper::Line> lines = m_wrapper.wrap(item.caption, box.width());
        double baseline = box.top() + m_wrapper.ascent();
        for (const CaptionWrapper::Line& line : lines) {
            const double x = box.left() + (box.width() - line.width) / 2;
            painter.drawText(QPointF(x, baseline), item.caption.mid(line.start, line.length));
            baseline += m_wrapper.lineSpacing();
        }
    };
    auto drawIcon = [&](const ListItem& item) {
        const QRectF box = shownIconRect(item);
        if (item.iconVisible && box.intersects(area))
            item.face.paint(painter, box.topLeft().toPoint());
    };

    // Captions lie on the list's own surface under the frame; icons are always above both.
    const std::vector<int> nearby = itemsNear(area.top(), area.bottom());
    for (int i : nearby) {
        if (i != current && m_model.isLoaded(i))
            drawCaption(m_model.at(i));
    }
    if (m_frame.visible && current >= 0) {
        const QRectF frame = selectionFrameRect();
        painter.setPen(QColor::fromRgb(ListGrid::FrameBorderColor));
        painter.setBrush(QColor::fromRgb(ListGrid::FrameFillColor));
        painter.drawRect(frame.adjusted(0.5, 0.5, -0.5, -0.5));
        painter.setBrush(Qt::NoBrush);
    }
    if (m_model.isLoaded(current))
        drawCaption(m_model.at(current));
    for (int i : nearby) {
        if (i != current && m_model.isLoaded(i))
            drawIcon(m_model.at(i));
    }
    if (m_model.isLoaded(current))
        drawIcon(m_model.at(current));
    paintFocusMark(painter);
}

} // namespace Brimvault
