// Keyboard focus and assistive technology: the focus mark, the focus events a screen reader follows, and
// acting on an item as Enter does.
#include "ui/listview/SimpleListView.h"
#include "ui/listview/SimpleListViewAccessible.h"

#include <QAccessible>
#include <QFocusEvent>
#include <QHelpEvent>
#include <QPainter>

namespace Brimvault {

void SimpleListView::installAccessibility()
{
    static const bool installed = [] {
        QAccessible::installFactory(&SimpleListViewAccessible::factory);
        return true;
    }();
    Q_UNUSED(installed);
}

void SimpleListView::shownItemsChanged()
{
    ++m_shownRevision;
    QAccessibleEvent event(this, QAccessible::ObjectReorder);
    QAccessible::updateAccessibility(&event);
}

int SimpleListView::currentItem() const
{
    const int current = m_frame.currentIndex();
    return !m_frame.tag.isEmpty() && isItemShown(current) ? current : -1;
}

QRect SimpleListView::itemRect(int index) const
{
    if (!m_model.isLoaded(index))
        return {};
    const ListItem& item = m_model.at(index);
    return shownIconRect(item).united(shownCaptionRect(item)).toAlignedRect();
}

void SimpleListView::activateItem(int index)
{
    if (!isItemShown(index) || selectItem(index))
        return;
    QString itemData = m_model.at(index).tag;
    Q_EMIT EnterKey(itemData);
}

void SimpleListView::focusItem(int index)
{
    if (!isItemShown(index) || selectItem(index))
        return;
    keepFrameInView();
    setFocus(Qt::OtherFocusReason);
}

bool SimpleListView::showsFocusMark() const
{
    const int current = currentItem();
    return m_keyboardCues && hasFocus() && current >= 0 && m_model.at(current).iconVisible;
}

void SimpleListView::notifyAccessibleFocus()
{
    // Nothing to tell while no reader listens: the interface is not even made.
    const int current = currentItem();
    if (!QAccessible::isActive() || !hasFocus() || current < 0)
        return;
    auto* accessible = static_cast<SimpleListViewAccessible*>(QAccessible::queryAccessibleInterface(this));
    const int child = accessible ? accessible->childOfItem(current) : -1;
    if (child < 0)
        return;
    QAccessibleEvent event(this, QAccessible::Focus);
    event.setChild(child);
    QAccessible::updateAccessibility(&event);
}

// The mark is shown once the keyboard is used, as desktop lists do, so that the mouse user's list looks as
// it always did; it outlives the timed highlight.
bool SimpleListView::event(QEvent* event)
{
    switch (event->type()) {
    case QEvent::KeyPress:
        setKeyboardCues(true);
        break;
    case QEvent::MouseButtonPress:
    case QEvent::MouseButtonDblClick:
        setKeyboardCues(false);
        break;
    case QEvent::ToolTip:
        return showItemToolTip(static_cast<QHelpEvent*>(event));
    default:
        break;
    }
    return QWidget::event(event);
}

void SimpleListView::setKeyboardCues(bool shown)
{
    if (m_keyboardCues == shown)
        return;
    m_keyboardCues = shown;
    update(selectionFrameRect().toAlignedRect().adjusted(-1, -1, 1, 1));
}

void SimpleListView::focusInEvent(QFocusEvent* event)
{
    if (event->reason() == Qt::TabFocusReason || event->reason() == Qt::BacktabFocusReason
        || event->reason() == Qt::ShortcutFocusReason)
        setKeyboardCues(true);
    QWidget::focusInEvent(event);
    notifyAccessibleFocus();
}

void SimpleListView::paintFocusMark(QPainter& painter) const
{
    if (!showsFocusMark())
        return;
    // Black and white dashes in turn stay visible on the list's colour and on the highlight alike.
    const QRectF mark = selectionFrameRect().adjusted(0.5, 0.5, -0.5, -0.5);
    QPen pen(Qt::black, 1, Qt::CustomDashLine);
    pen.setDashPattern({2, 2});
    painter.setBrush(Qt::NoBrush);
    painter.setPen(pen);
    painter.drawRect(mark);
    pen.setColor(Qt::white);
    pen.setDashOffset(2);
    painter.setPen(pen);
    painter.drawRect(mark);
}

} // namespace Brimvault
