#include "ui/main/MainWindowDesign.h"

#include <QSize>

namespace Brimvault::MainWindowDesign {

QRect ListViewGeometry(const QSize& clientPixels, FormScaling::TwipsPerPixel screen)
{
    const double widthTwips = clientPixels.width() * screen.x - ListWidthLoss;
    const double heightTwips = clientPixels.height() * screen.y - ListHeightLoss;
    if (widthTwips <= 0 || heightTwips <= 0)
        return {};
    return {FormScaling::TwipsToPixelsX(ListLeft, screen), FormScaling::TwipsToPixelsY(ListTop, screen),
        FormScaling::TwipsToPixelsX(widthTwips, screen), FormScaling::TwipsToPixelsY(heightTwips, screen)};
}

QColor BandTopColor()
{
    return {30, 44, 84};
}

QColor BandBottomColor()
{
    return {58, 82, 140};
}

QColor BandEdgeColor()
{
    return {112, 140, 204};
}

QColor FrameColor()
{
    return {66, 90, 146};
}

} // namespace Brimvault::MainWindowDesign
