#include "ui/listview/ListConstants.h"
#include "ui/listview/SimpleListView.h"

#include <QScrollBar>

namespace Brimvault {

namespace {

// The selection moves without drawing: the arrangement that follows selects the new current item.
void moveCurrent(ListModel& model, SelectionFrame& frame, int index, QRgb backColor)
{
    const int old = frame.currentIndex();
    if (model.isLoaded(old)) {
        model.at(old).face.setBackColor(backColor);
        model.at(old).captionColor = ListGrid::CaptionColor;
    }
    frame.tag = QString::number(index);
}

} // namespace

void SimpleListView::setNarrowing(NarrowingTest shows)
{
    m_narrowing = std::move(shows);
    int firstShown = -1;
    for (int i = 0; i < m_model.loadedCount(); ++i) {
        ListItem& item = m_model.at(i);
        const bool empty = i >= m_state.itemCount;
        item.narrowedOut = m_narrowing && !empty && !m_narrowing(i, item.caption, item.tag);
        if (firstShown < 0 && !item.narrowedOut && !empty)
            firstShown = i;
    }
    // A narrowed list starts at its first match; the full list keeps where the selection was.
    if (m_narrowing && firstShown >= 0)
        moveCurrent(m_model, m_frame, firstShown, m_backColor.rgb());
    else
        selectShownNear(m_frame.currentIndex());
    m_vbar->setValue(0);
    arrangeItems();
    m_vbar->setValue(0);
    shownItemsChanged();
}

int SimpleListView::firstShown() const
{
    for (int i = 0; i < m_state.itemCount && i < m_model.loadedCount(); ++i) {
        if (!m_model.at(i).narrowedOut)
            return i;
    }
    return 0;
}

bool SimpleListView::isItemShown(int index) const
{
    return m_model.isLoaded(index) && index < m_state.itemCount && !m_model.at(index).narrowedOut;
}

int SimpleListView::shownCount() const
{
    int count = 0;
    for (int i = 0; i < m_state.itemCount && i < m_model.loadedCount(); ++i)
        count += m_model.at(i).narrowedOut ? 0 : 1;
    return count;
}

void SimpleListView::restoreView(int index, int scrollValue)
{
    if (isItemShown(index))
        selectItem(index);
    if (m_vbar->isVisibleTo(this))
        m_vbar->setValue(scrollValue);
}

void SimpleListView::selectShownNear(int index)
{
    if (!m_model.isLoaded(index) || !m_model.at(index).narrowedOut)
        return;
    for (int i = index + 1; i < m_model.loadedCount(); ++i) {
        if (!m_model.at(i).narrowedOut) {
            moveCurrent(m_model, m_frame, i, m_backColor.rgb());
            return;
        }
    }
    for (int i = index - 1; i >= 0; --i) {
        if (!m_model.at(i).narrowedOut) {
            moveCurrent(m_model, m_frame, i, m_backColor.rgb());
            return;
        }
    }
}

void SimpleListView::renarrowCurrent()
{
    const int current = m_frame.currentIndex();
    if (!m_narrowing || !isItemShown(current))
        return;
    ListItem& item = m_model.at(current);
    if (m_narrowing(current, item.caption, item.tag))
        return;
    item.narrowedOut = true;
    selectShownNear(current);
    arrangeItems();
    shownItemsChanged();
}

} // namespace Brimvault
