// Icons for screens that draw more than one pixel per unit: the 32-pixel cell shows the image that fills its
// real pixels, so a 64- or 256-pixel image is not blurred up from the 32-pixel one.
#include "icons/cFileIcon.h"

#include "icons/IconImageDecoder.h"

#include <QImage>
#include <QScreen>

#include <cmath>

namespace Brimvault {

namespace {

constexpr int CellPixels = 32;

} // namespace

qreal cFileIcon::displayPixelRatio()
{
    const QScreen* screen = displayScreen();
    return screen ? screen->devicePixelRatio() : 1.0;
}

int cFileIcon::sharpIconIndex(int wantedPixels, int wantedDepth) const
{
    // The smallest image that covers the wanted pixels, else the largest; among equals the deepest up to the
    // display's depth.
    int best = 0;
    // A width byte of 0 stands for 256 pixels.
    auto widthOf = [this](int i) { return ImageWidth(i) == 0 ? 256 : ImageWidth(i); };
    auto better = [&](int i) {
        const int width = widthOf(i), bestWidth = widthOf(best);
        const bool covers = width >= wantedPixels, bestCovers = bestWidth >= wantedPixels;
        if (covers != bestCovers)
            return covers;
        if (width != bestWidth)
            return covers ? width < bestWidth : width > bestWidth;
        return std::abs(imageDepth(i) - wantedDepth) < std::abs(imageDepth(best) - wantedDepth);
    };
    for (int i = 1; i <= qMin<int>(ImageCount(), int(m_entries.size())); ++i) {
        if (best == 0 || better(i))
            best = i;
    }
    return best;
}

bool cFileIcon::ScreenPictureIsSound()
{
    if (m_entries.isEmpty() || displayPixelRatio() > 1.0)
        return false;
    const int index = bestIconIndex(displayDepth());
    return index >= 1 && index <= m_images.size() && IconImageDecoder::IsSoundBitmap(m_images.at(index - 1));
}

QImage cFileIcon::ScreenIconPicture()
{
    const qreal ratio = displayPixelRatio();
    if (m_entries.isEmpty() || ratio <= 1.0)
        return BestIconPicture();
    const int wanted = int(std::ceil(CellPixels * ratio));
    const int index = sharpIconIndex(wanted, displayDepth());
    QImage picture = index > 0 ? IconHandle(index) : QImage();
    if (picture.width() <= CellPixels)
        return BestIconPicture();
    if (picture.width() != wanted || picture.height() != wanted)
        picture = picture.scaled(wanted, wanted, Qt::IgnoreAspectRatio, Qt::SmoothTransformation);
    picture.setDevicePixelRatio(ratio);
    return picture;
}

} // namespace Brimvault
