#include "ui/listview/KeyNavigation.h"
#include "ui/listview/ListConstants.h"
#include "ui/listview/SimpleListView.h"

#include <QKeyEvent>
#include <QMouseEvent>
#include <QScrollBar>
#include <QTimer>

#include <cmath>

namespace Brimvault {

namespace {

qint16 buttonCode(Qt::MouseButtons buttons)
{
    qint16 code = 0;
    if (buttons & Qt::LeftButton)
        code |= 1;
    if (buttons & Qt::RightButton)
        code |= 2;
    if (buttons & Qt::MiddleButton)
        code |= 4;
    return code;
}

} // namespace

ListError SimpleListView::selectItem(int index)
{
    if (!m_model.isLoaded(index))
        return ListError::missingElement(index);
    ListItem& item = m_model.at(index);
    const QRectF frame = KeyNavigation::frameRect(shownIconRect(item), shownCaptionRect(item));

    const QRectF oldFrame = selectionFrameRect();
    m_frame.rect = frame.translated(-m_state.horizontalOffset, -m_state.scrollOffsetY);

    const int old = m_frame.currentIndex();
    const bool moved = m_frame.tag.isEmpty() || old != index;
    if (m_model.isLoaded(old)) {
        m_model.at(old).face.setBackColor(m_backColor.rgb());
        m_model.at(old).captionColor = ListGrid::CaptionColor;
        updateItem(old);
    }
    m_frame.tag = QString::number(index);
    item.face.setBackColor(ListGrid::FrameFillColor);
    item.captionColor = ListGrid::SelectedCaptionColor;

    if (isVisible()) {
        update(oldFrame.toAlignedRect().adjusted(-1, -1, 1, 1));
        update(frame.toAlignedRect().adjusted(-1, -1, 1, 1));
    }
    if (isHidden())
        return {};
    if (item.iconVisible)
        m_frame.visible = true;
    m_timer->stop();
    m_timer->start();
    if (moved)
        notifyAccessibleFocus();
    return {};
}

void SimpleListView::onHighlightTimeout()
{
    m_timer->stop();
    m_frame.visible = false;
    const int current = m_frame.currentIndex();
    if (m_model.isLoaded(current))
        m_model.at(current).face.setBackColor(m_backColor.rgb());
    update(selectionFrameRect().toAlignedRect().adjusted(-1, -1, 1, 1));
}

void SimpleListView::keyPressEvent(QKeyEvent* event)
{
    switch (event->key()) {
    case Qt::Key_Left:
        moveByArrow(int(KeyNavigation::Direction::Left));
        break;
    case Qt::Key_Up:
        moveByArrow(int(KeyNavigation::Direction::Up));
        break;
    case Qt::Key_Right:
        moveByArrow(int(KeyNavigation::Direction::Right));
        break;
    case Qt::Key_Down:
        moveByArrow(int(KeyNavigation::Direction::Down));
        break;
    case Qt::Key_Return:
    case Qt::Key_Enter: {
        const int current = m_frame.currentIndex();
        selectItem(current);
        QString currentData = GetCurrentData();
        Q_EMIT EnterKey(currentData);
        break;
    }
    default:
        break;
    }
    event->accept();
}

void SimpleListView::moveByArrow(int keyCode)
{
    const std::optional<KeyNavigation::Direction> direction = KeyNavigation::directionFromKeyCode(keyCode);
    const int current = m_frame.currentIndex();
    if (!direction || !m_model.isLoaded(current))
        return;
    const QRectF icon = shownIconRect(m_model.at(current));
    const QPointF reference
        = KeyNavigation::referencePoint(icon.topLeft(), m_state.visibleWidth, m_state.visibleHeight);
    const std::optional<int> target
        = KeyNavigation::findNeighbour(m_model, m_state.scrollOffsetY, current, *direction, reference, double(width()));
    if (!target)
        return;
    selectItem(*target);
    keepFrameInView();
}

void SimpleListView::keepFrameInView()
{
    if (!m_vbar->isVisibleTo(this))
        return;
    const QRectF frame = selectionFrameRect();
    if (frame.top() < 0)
        m_vbar->setValue(int(std::max(frame.top() - m_state.scrollOffsetY, 0.0)));
    const QRectF moved = selectionFrameRect();
    if (moved.top() + moved.height() > height()) {
        m_state.updatingScroll = true;
        const double wanted = std::abs(moved.top() + moved.height() - height()) - m_state.scrollOffsetY;
        m_vbar->setValue(int(std::min(wanted, double(m_vbar->maximum()))));
        m_state.updatingScroll = false;
        scrollContents(m_vbar->value());
    }
}

SimpleListView::Hit SimpleListView::hitTest(const QPointF& point) const
{
    // Icons lie above captions; among each kind the current item is on top, then later elements.
    const int current = m_frame.currentIndex();
    auto iconAt = [&](int i) {
        const ListItem& item = m_model.at(i);
        return item.iconVisible && !item.narrowedOut && shownIconRect(item).contains(point);
    };
    auto captionAt = [&](int i) {
        const ListItem& item = m_model.at(i);
        return item.captionVisible && !item.narrowedOut && shownCaptionRect(item).contains(point);
    };
    const std::vector<int>& nearby = itemsNear(point.y(), point.y());
    if (m_model.isLoaded(current) && iconAt(current))
        return {current, true, shownIconRect(m_model.at(current)).topLeft()};
    for (auto it = nearby.rbegin(); it != nearby.rend(); ++it) {
        if (m_model.isLoaded(*it) && iconAt(*it))
            return {*it, true, shownIconRect(m_model.at(*it)).topLeft()};
    }
    if (m_model.isLoaded(current) && captionAt(current))
        return {current, false, shownCaptionRect(m_model.at(current)).topLeft()};
    for (auto it = nearby.rbegin(); it != nearby.rend(); ++it) {
        if (m_model.isLoaded(*it) && captionAt(*it))
            return {*it, false, shownCaptionRect(m_model.at(*it)).topLeft()};
    }
    return {};
}

qint16 SimpleListView::shiftState(Qt::KeyboardModifiers modifiers) const
{
    qint16 shift = 0;
    if (modifiers & Qt::ShiftModifier)
        shift |= 1;
    if (modifiers & Qt::ControlModifier)
        shift |= 2;
    if (modifiers & Qt::AltModifier)
        shift |= 4;
    return shift;
}

void SimpleListView::mousePressEvent(QMouseEvent* event)
{
    const bool firstButton = event->buttons() == event->button();
    const Hit hit = hitTest(event->position());
    // Whatever is pressed first keeps the mouse until the last button is released, as a child control would;
    // the background is the list's own, and the items hear nothing of it.
    if (firstButton)
        m_capture = hit.index < 0 ? Hit {-1, false, {}, true} : hit;
    if (hit.index < 0 || m_capture.background) {
        QWidget::mousePressEvent(event);
        return;
    }
    if (m_capture.index < 0)
        m_capture = hit;
    selectItem(hit.index);
    const QPointF local = event->position() - hit.origin;
    Q_EMIT MouseDown(buttonCode(event->button()), shiftState(event->modifiers()), float(local.x()), float(local.y()));
}

void SimpleListView::mouseMoveEvent(QMouseEvent* event)
{
    const bool held = event->buttons() != Qt::NoButton;
    if (held && m_capture.background)
        return;
    Hit target = m_capture;
    if (target.index < 0 || !held)
        target = hitTest(event->position());
    if (target.index < 0 || !m_model.isLoaded(target.index))
        return;
    const QPointF local = event->position() - target.origin;
    Q_EMIT MouseMove(buttonCode(event->buttons()), shiftState(event->modifiers()), float(local.x()), float(local.y()));
}

void SimpleListView::mouseReleaseEvent(QMouseEvent* event)
{
    const Hit target = m_capture.index >= 0 || m_capture.background ? m_capture : hitTest(event->position());
    if (event->buttons() == Qt::NoButton)
        m_capture = {};
    if (target.index < 0 || !m_model.isLoaded(target.index))
        return;
    selectItem(target.index);
    const QPointF local = event->position() - target.origin;
    const qint16 button = buttonCode(event->button());
    Q_EMIT MouseUp(button, shiftState(event->modifiers()), float(local.x()), float(local.y()));
    m_state.lastButton = button;
}

void SimpleListView::mouseDoubleClickEvent(QMouseEvent* event)
{
    const Hit hit = hitTest(event->position());
    m_capture = hit.index < 0 ? Hit {-1, false, {}, true} : hit;
    if (hit.index < 0)
        return;
    if (m_state.lastButton != 1)
        return;
    QString currentData = m_model.at(hit.index).tag;
    Q_EMIT EnterKey(currentData);
}

} // namespace Brimvault
