#include "ui/listview/KeyNavigation.h"

#include "ui/listview/ListConstants.h"
#include "ui/listview/ListModel.h"

#include <algorithm>
#include <cmath>

namespace Brimvault::KeyNavigation {

std::optional<Direction> directionFromKeyCode(int keyCode)
{
    if (keyCode >= int(Direction::Left) && keyCode <= int(Direction::Down))
        return Direction(keyCode);
    return std::nullopt;
}

QPointF referencePoint(QPointF iconTopLeft, int visibleWidth, int visibleHeight)
{
    double x = iconTopLeft.x();
    double y = iconTopLeft.y();
    if (y < 0)
        y = 95;
    else if (y > visibleHeight)
        y = visibleHeight - 120;
    if (x < 0)
        x = 80;
    else if (x > visibleWidth)
        x = visibleWidth - 120;
    return {x, y};
}

std::optional<int> findNeighbour(const ListModel& model, double scrollOffsetY, int currentIndex, Direction direction,
    QPointF reference, double clientWidth)
{
    constexpr double half = ListGrid::IconSize / 2.0;
    double best = clientWidth * 10;
    std::optional<int> target;
    for (int i = 0; i < model.loadedCount(); ++i) {
        if (i == currentIndex)
            continue;
        const ListItem& item = model.at(i);
        if (item.narrowedOut)
            continue;
        const double left = item.iconLeft;
        const double top = item.iconTop + scrollOffsetY;
        bool candidate = false;
        switch (direction) {
        case Direction::Up:
            candidate = top < reference.y() - half;
            break;
        case Direction::Down:
            candidate = top > reference.y() + half;
            break;
        case Direction::Left:
            candidate = left < reference.x() - half;
            break;
        case Direction::Right:
            candidate = left > reference.x() + half;
            break;
        }
        if (!candidate)
            continue;
        const double distance = std::hypot(left - reference.x(), top - reference.y());
        if (distance < best) {
            best = distance;
            target = i;
        }
    }
    return target;
}

QRectF frameRect(const QRectF& icon, const QRectF& caption)
{
    constexpr double margin = ListGrid::SelectionMargin;
    double left = std::min(icon.left(), caption.left()) - margin;
    double top = std::min(icon.top(), caption.top()) - margin;
    double width = std::max(icon.left() + icon.width(), caption.left() + caption.width()) - left + 2 * margin;
    double height = std::max(icon.top() + icon.height(), caption.top() + caption.height()) - top + 2 * margin;
    if (width < 0) {
        width = -width;
        left -= width / 2;
    }
    if (height < 0) {
        height = -height;
        top -= height / 2;
    }
    return {left, top, width, height};
}

} // namespace Brimvault::KeyNavigation
