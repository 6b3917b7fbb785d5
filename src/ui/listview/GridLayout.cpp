#include "ui/listview/GridLayout.h"

#include "ui/listview/ListConstants.h"
#include "ui/listview/ListModel.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Brimvault::GridLayout {

namespace {

// Scroll positions are not held to 16 bits: a library of tens of thousands of games is far taller than
// 32767 pixels and must still scroll to its end.
int toScrollPosition(double value)
{
    const double rounded = roundHalfEven(value);
    return int(std::clamp(rounded, 0.0, double(std::numeric_limits<int>::max())));
}

double iconOffset()
{
    return double(roundedIntDiv(ListGrid::CellWidth - ListGrid::IconSize, 2));
}
double captionOffset()
{
    return double(roundedIntDiv(roundHalfEven(ListGrid::CellWidth - ListGrid::CaptionWidth), 2));
}

} // namespace

double roundHalfEven(double value)
{
    return std::nearbyint(value);
}

long long roundedIntDiv(double dividend, double divisor)
{
    const auto a = static_cast<long long>(roundHalfEven(dividend));
    const auto b = static_cast<long long>(roundHalfEven(divisor));
    return b == 0 ? 0 : a / b;
}

void arrangeAll(ListModel& model, ListLayoutState& state, SelectionFrame& frame, double usableWidth)
{
    state.rowTops = {0.0};
    state.nextCellX = 0;
    state.rowTop = ListGrid::RowGap;
    state.lowestBottom = 0;
    state.maxColumns = 0;
    int column = 0;

    // The frame keeps its place on screen; only the items are laid out for position 0.
    frame.rect.translate(state.horizontalOffset, state.scrollOffsetY);
    state.horizontalOffset = 0;
    state.scrollOffsetY = 0;

    for (int i = 0; i < model.loadedCount(); ++i) {
        ListItem& item = model.at(i);
        if (item.narrowedOut)
            continue;
        ++column;
        if (state.nextCellX + ListGrid::CellWidth > usableWidth) {
            state.nextCellX = 0;
            state.rowTop = state.lowestBottom + ListGrid::RowGap;
            state.rowTops.append(state.rowTop);
            column = 1;
        }
        state.maxColumns = std::max(state.maxColumns, column);
        item.iconLeft = float(state.nextCellX + iconOffset());
        item.iconTop = float(state.rowTop);
        item.captionLeft = float(state.nextCellX + captionOffset());
        item.captionTop = float(state.rowTop + ListGrid::IconSize + ListGrid::CaptionGap);
        state.nextCellX += ListGrid::CellWidth;
        state.lowestBottom = std::max(state.lowestBottom, double(item.captionTop) + item.captionHeight);
    }
}

void placeNext(ListItem& item, ListLayoutState& state, double usableWidth)
{
    if (state.nextCellX + ListGrid::CellWidth > usableWidth) {
        state.rowTop = state.lowestBottom + ListGrid::RowGap;
        state.nextCellX = 0;
        state.rowTops.append(state.rowTop);
    }
    // Stored unscrolled: shown at scrollOffsetY + rowTop.
    item.iconLeft = float(state.nextCellX + iconOffset());
    item.iconTop = float(state.rowTop);
    item.captionLeft = float(state.nextCellX + captionOffset());
    item.captionTop = float(ListGrid::IconSize + state.rowTop + ListGrid::CaptionGap);
}

void finishAdd(const ListItem& item, ListLayoutState& state)
{
    state.nextCellX += ListGrid::CellWidth;
    const double shownBottom = double(item.captionTop) + state.scrollOffsetY + item.captionHeight;
    state.lowestBottom = std::max(state.lowestBottom, shownBottom);
}

Extent contentExtent(const ListModel& model, const SelectionFrame& frame, const ListLayoutState& state)
{
    Extent extent;
    auto include = [&](double left, double top, double width, double height) {
        extent.right = std::max(extent.right, left + width - state.horizontalOffset);
        extent.bottom = std::max(extent.bottom, top + height);
    };
    include(frame.rect.left() + state.horizontalOffset, frame.rect.top(), frame.rect.width(), frame.rect.height());
    for (int i = 0; i < model.loadedCount(); ++i) {
        const ListItem& item = model.at(i);
        if (item.narrowedOut)
            continue;
        include(item.iconLeft + state.horizontalOffset, item.iconTop, ListGrid::IconSize, ListGrid::IconSize);
        include(item.captionLeft + state.horizontalOffset, item.captionTop, ListGrid::CaptionWidth, item.captionHeight);
    }
    return extent;
}

ScrollRange scrollRange(int itemCount, const Extent& extent, QSize client)
{
    ScrollRange range;
    if (itemCount == 0)
        return range;
    range.needed = extent.bottom > client.height();
    if (!range.needed)
        return range;
    range.maximum = toScrollPosition(extent.bottom - client.height() + ListGrid::RowGap);
    range.smallChange = ListGrid::CellWidth;
    range.largeChange = client.height() > 0 ? toScrollPosition(client.height()) : 0;
    return range;
}

} // namespace Brimvault::GridLayout
