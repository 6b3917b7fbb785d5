#include "ui/listview/RowSnapping.h"

#include "ui/listview/GridLayout.h"

#include <algorithm>
#include <cmath>

namespace Brimvault::RowSnapping {

std::optional<int> snapTarget(const QList<double>& rowTops, int value, int maximum)
{
    if (value == maximum)
        return std::nullopt;
    double best = maximum;
    double target = value;
    for (double rowTop : rowTops) {
        const double distance = std::abs(rowTop - value);
        if (distance < best) {
            best = distance;
            target = rowTop;
        }
    }
    if (target >= maximum)
        return std::nullopt;
    return int(GridLayout::roundHalfEven(target));
}

int wheelTarget(const QList<double>& rowTops, int value, int maximum, int notches)
{
    int position = value;
    for (; notches > 0; --notches) {
        int next = maximum;
        for (double rowTop : rowTops) {
            const int top = int(GridLayout::roundHalfEven(rowTop));
            if (top > position && top < next)
                next = top;
        }
        position = next;
    }
    for (; notches < 0; ++notches) {
        int previous = 0;
        for (double rowTop : rowTops) {
            const int top = int(GridLayout::roundHalfEven(rowTop));
            if (top < position && top > previous && top < maximum)
                previous = top;
        }
        position = previous;
    }
    return std::clamp(position, 0, std::max(maximum, 0));
}

} // namespace Brimvault::RowSnapping
