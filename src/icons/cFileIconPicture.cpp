#include "icons/cFileIcon.h"

#include "icons/IconImageDecoder.h"

#include <QGuiApplication>
#include <QImage>
#include <QPainter>
#include <QScreen>
#include <cmath>

namespace Brimvault {

namespace {

constexpr int WantedWidth = 32;

QPainter::CompositionMode compositionFor(quint32 rop)
{
    switch (rop) {
    case SRCAND:
        return QPainter::RasterOp_SourceAndDestination;
    case SRCPAINT:
        return QPainter::RasterOp_SourceOrDestination;
    case SRCINVERT:
        return QPainter::RasterOp_SourceXorDestination;
    case SRCCOPY:
        return QPainter::CompositionMode_Source;
    default:
        return QPainter::CompositionMode_SourceOver;
    }
}

} // namespace

const QScreen* cFileIcon::displayScreen()
{
    return qobject_cast<QGuiApplication*>(QCoreApplication::instance()) ? QGuiApplication::primaryScreen() : nullptr;
}

int cFileIcon::displayDepth()
{
    if (m_displayDepth == 0) {
        const QScreen* screen = displayScreen();
        m_displayDepth = screen && screen->depth() > 0 ? screen->depth() : 32;
    }
    return m_displayDepth;
}

double cFileIcon::imageDepth(int nIndex) const
{
    const qint64 colours = ImageColourCount(nIndex);
    return colours == -1 ? 32.0 : std::round(std::log2(double(colours)));
}

int cFileIcon::bestIconIndex(int wantedDepth) const
{
    int best = 1;
    int widthDistance = 256;
    double depthDistance = 32;
    for (int i = 1; i <= qMin<int>(ImageCount(), int(m_entries.size())); ++i) {
        const double depth = imageDepth(i);
        if (ImageWidth(i) == WantedWidth) {
            if (depth == wantedDepth)
                return i;
            if (std::abs(depth - wantedDepth) < depthDistance) {
                best = i;
                depthDistance = std::abs(depth - wantedDepth);
                widthDistance = 0;
            }
        } else if (std::abs(ImageWidth(i) - WantedWidth) < widthDistance) {
            best = i;
            widthDistance = std::abs(ImageWidth(i) - WantedWidth);
        }
    }
    return best;
}

QImage cFileIcon::BestIconPicture()
{
    if (m_entries.isEmpty())
        return {};
    return IconHandle(bestIconIndex(displayDepth()));
}

QImage cFileIcon::IconHandle(int nIndex) const
{
    if (nIndex < 1 || nIndex > m_images.size())
        return {};
    return IconImageDecoder::DecodePicture(m_images.at(nIndex - 1));
}

QImage cFileIcon::IconPicture(int nIndex) const
{
    return IconHandle(nIndex);
}

void cFileIcon::DrawIconImage(
    QPainter& painter, int nIndex, bool bMask, int x, int y, int lWidth, int lHeight, quint32 lRop) const
{
    if (nIndex < 1 || nIndex > m_images.size())
        return;
    const IconImageDecoder::Bitmaps bitmaps = IconImageDecoder::Decode(m_images.at(nIndex - 1));
    const QImage& picture = bMask ? bitmaps.mask : bitmaps.colour;
    if (picture.isNull())
        return;
    const QSize natural = picture.size();
    QRect target(x, y, natural.width(), natural.height());
    if (lWidth != 0 || lHeight != 0)
        target.setSize(QSize(lWidth != 0 ? lWidth : natural.width(), lHeight != 0 ? lHeight : natural.height()));
    painter.save();
    painter.setCompositionMode(compositionFor(lRop));
    painter.drawImage(target, picture);
    painter.restore();
}

} // namespace Brimvault
