#pragma once

#include <QSize>

namespace Brimvault {

class ListModel;
struct ListItem;
struct ListLayoutState;
struct SelectionFrame;

// The grid arithmetic of the icon list, free of widgets: cells 80 wide flowing left to right, rows as tall as
// their tallest caption. Positions written here are unscrolled; the state's scrollOffsetY shifts them all.
namespace GridLayout {

// Integer division of the host language: both operands rounded half to even, the quotient truncated.
long long roundedIntDiv(double dividend, double divisor);
double roundHalfEven(double value);

// Full arrangement for scroll position 0. Every loaded element takes a cell, hidden ones included.
void arrangeAll(ListModel& model, ListLayoutState& state, SelectionFrame& frame, double usableWidth);

// Places a newly loaded element in the next free cell, before its caption text is set.
void placeNext(ListItem& item, ListLayoutState& state, double usableWidth);

// Advances to the next cell once the new element's caption is set. The caption bottom is taken where the
// caption is shown, so a scrolled list records it in scrolled coordinates until the next arrangement.
void finishAdd(const ListItem& item, ListLayoutState& state);

struct Extent {
    double right = 0;
    double bottom = 0;
};
// The lowest and rightmost edges of icons, captions and the selection frame at scroll position 0.
Extent contentExtent(const ListModel& model, const SelectionFrame& frame, const ListLayoutState& state);

struct ScrollRange {
    bool needed = false;
    int maximum = 0;
    int smallChange = 80;
    int largeChange = 0; // 0: leave it as it is
};
ScrollRange scrollRange(int itemCount, const Extent& extent, QSize client);

} // namespace GridLayout
} // namespace Brimvault
