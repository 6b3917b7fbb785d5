#pragma once

#include <QPointF>
#include <QRectF>

#include <optional>

namespace Brimvault {

class ListModel;

// Arrow-key movement and the selection frame's geometry, free of widgets.
namespace KeyNavigation {

enum class Direction { Left = 37, Up = 38, Right = 39, Down = 40 };

std::optional<Direction> directionFromKeyCode(int keyCode);

// The point the search starts from: the current icon's corner, or a stand-in inside the visible area when
// that icon is scrolled out of view.
QPointF referencePoint(QPointF iconTopLeft, int visibleWidth, int visibleHeight);

// The icon nearest to the reference point (straight-line distance of top-left corners) that lies beyond
// half an icon in the given direction; ties keep the lower index. Icon tops are taken shown, i.e. with
// scrollOffsetY added.
std::optional<int> findNeighbour(const ListModel& model, double scrollOffsetY, int currentIndex, Direction direction,
    QPointF reference, double clientWidth);

// The selection frame around an item: 3 beyond it on the left and top, 6 on the right and bottom.
QRectF frameRect(const QRectF& icon, const QRectF& caption);

} // namespace KeyNavigation
} // namespace Brimvault
