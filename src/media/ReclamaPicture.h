#pragma once

#include <QColor>

class QImage;
class QPainter;
class QRect;

namespace Brimvault::ReclamaPicture {

// The colour of the picture's surroundings: the mean of 100 pixels along a line 30 pixels inside its top
// edge and 100 along a line 30 pixels inside its bottom edge, at x = 30 + k * (width div 100). The fallback
// when the picture is too small to sample.
QColor SurroundingColour(const QImage& picture, const QColor& fallback);

// The picture centred in the area, shrunk to fit when larger; the space around it runs from the
// surrounding colour at the top to its half shade at the bottom.
void PaintPicture(QPainter& painter, const QRect& area, const QImage& picture, const QColor& surrounding);

} // namespace Brimvault::ReclamaPicture
