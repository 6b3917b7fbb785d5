#pragma once

#include <QList>

#include <optional>

namespace Brimvault::RowSnapping {

// The row start nearest to value, when the scroll position should move there: never at the maximum (the end
// of the list is never snapped) and never to a row start at or beyond the maximum. Ties keep the earlier row.
std::optional<int> snapTarget(const QList<double>& rowTops, int value, int maximum);

// Where the wheel takes the list: one row start per notch (positive notches scroll down), the maximum after
// the last row start, 0 above the first.
int wheelTarget(const QList<double>& rowTops, int value, int maximum, int notches);

} // namespace Brimvault::RowSnapping
