#include "ui/listview/GridLayout.h"
#include "ui/listview/ListConstants.h"
#include "ui/listview/RowSnapping.h"
#include "ui/listview/SimpleListView.h"

#include <QResizeEvent>
#include <QScrollBar>
#include <QShowEvent>

#include <algorithm>

namespace Brimvault {

double SimpleListView::usableWidth() const
{
    // The bar's width is reserved whether it shows or not, so showing it never re-flows the grid.
    return double(width()) - m_vbar->width();
}

QRect SimpleListView::itemArea() const
{
    QRect area = rect();
    if (m_vbar->isVisibleTo(this))
        area.setRight(m_vbar->geometry().left() - 1);
    return area;
}

void SimpleListView::arrangeItems()
{
    GridLayout::arrangeAll(m_model, m_state, m_frame, usableWidth());
    m_bands.invalidate();
    selectItem(m_frame.currentIndex());
    updateScrollRange();
    update();
}

void SimpleListView::updateScrollRange()
{
    const QSize client = size();
    m_state.visibleWidth = client.width();
    m_state.visibleHeight = client.height();
    const GridLayout::ScrollRange range
        = GridLayout::scrollRange(m_state.itemCount, GridLayout::contentExtent(m_model, m_frame, m_state), client);
    if (range.needed) {
        const int barWidth = m_vbar->width();
        m_vbar->setGeometry(client.width() - barWidth, 0, barWidth, std::max(client.height(), 0));
        m_vbar->setSingleStep(range.smallChange);
        if (range.largeChange > 0)
            m_vbar->setPageStep(range.largeChange);
        m_vbar->setMaximum(range.maximum);
        m_vbar->show();
        m_vbar->raise();
    } else {
        m_vbar->setValue(0);
        m_vbar->hide();
    }
}

void SimpleListView::scrollContents(int value)
{
    const double dx = -m_state.horizontalOffset;
    const double dy = -double(value) - m_state.scrollOffsetY;
    m_state.horizontalOffset = 0;
    m_state.scrollOffsetY = -double(value);
    if (dy == 0 && dx == 0)
        return;
    const QRect area = itemArea();
    const int shift = int(dy);
    if (shift == dy && std::abs(shift) < area.height())
        scroll(int(dx), shift, area); // only the uncovered strip is painted again
    else
        update(area);
}

void SimpleListView::onScrollValueChanged(int value)
{
    if (!m_state.updatingScroll && value != m_vbar->maximum()) {
        if (const std::optional<int> target = RowSnapping::snapTarget(m_state.rowTops, value, m_vbar->maximum())) {
            m_state.updatingScroll = true;
            m_vbar->setValue(*target);
            m_state.updatingScroll = false;
        }
    }
    scrollContents(m_vbar->value());
}

void SimpleListView::onSliderMoved(int position)
{
    scrollContents(position);
}

void SimpleListView::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    arrangeItems();
}

void SimpleListView::showEvent(QShowEvent* event)
{
    QWidget::showEvent(event);
    if (!m_state.shownOnce) {
        m_state.shownOnce = true;
        updateScrollRange();
    }
}

void SimpleListView::changeEvent(QEvent* event)
{
    QWidget::changeEvent(event);
    if (event->type() != QEvent::FontChange)
        return;
    // Captions are measured in the list's font; a new font means new caption heights and a new grid.
    m_wrapper.setFont(font());
    for (int i = 0; i < m_model.loadedCount(); ++i)
        setCaptionText(m_model.at(i), m_model.at(i).caption);
    m_bands.invalidate();
    arrangeItems();
}

void SimpleListView::wheelEvent(QWheelEvent* event)
{
    if (!m_vbar->isVisibleTo(this)) {
        event->ignore();
        return;
    }
    // One row per notch: every wheel stop lands on a row start, the same places a released drag snaps to.
    m_wheelRemainder += event->angleDelta().y();
    const int notches = m_wheelRemainder / 120;
    m_wheelRemainder -= notches * 120;
    if (notches != 0) {
        const int target = RowSnapping::wheelTarget(m_state.rowTops, m_vbar->value(), m_vbar->maximum(), -notches);
        m_vbar->setValue(target);
    }
    event->accept();
}

} // namespace Brimvault
