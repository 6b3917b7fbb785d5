#pragma once

#include <QRect>

class QWidget;

namespace Brimvault::FormScaling {

// Forms are designed in twips at 96 dots per inch, where a pixel is 15 twips; elsewhere a pixel is
// 1440 / logical dpi twips.
inline constexpr double DesignTwipsPerPixel = 15.0;

struct TwipsPerPixel {
    double x = DesignTwipsPerPixel;
    double y = DesignTwipsPerPixel;
};

// The screen's twips per pixel as seen by the widget.
TwipsPerPixel ScreenTwipsPerPixel(const QWidget* widget);

// A rectangle in twips on a screen with the given twips per pixel, in pixels (rounded).
QRect TwipsToPixels(const QRect& twips, TwipsPerPixel screen);
int TwipsToPixelsX(double twips, TwipsPerPixel screen);
int TwipsToPixelsY(double twips, TwipsPerPixel screen);

// The load-time factors: the screen's twips per pixel over the designed 15.
struct Factors {
    double x = 1.0;
    double y = 1.0;
    bool isIdentity() const { return x == 1.0 && y == 1.0; }
};
Factors ScreenFactors(TwipsPerPixel screen);

// Multiplies the form's own position and size, then every control's (left and width by x, top and height
// by y) and every control's font size by x. Nothing changes when both factors are exactly 1. Controls are
// the form's direct child widgets; menus and other windows have no place on the form and keep theirs, as
// does a font given in pixels.
void ScaleForm(QWidget* form, Factors factors);

} // namespace Brimvault::FormScaling
