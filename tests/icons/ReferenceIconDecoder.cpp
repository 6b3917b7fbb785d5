// The icon image decoder as it was when every pixel went through the byte reader: slow, but plainly right,
// so the faster decoder is compared against it.
#include "ReferenceIconDecoder.h"

#include "icons/ByteReader.h"
#include "icons/PeLayout.h"

#include <QBuffer>
#include <QByteArray>
#include <QImageReader>

namespace IconTest::ReferenceIconDecoder {

using namespace Brimvault;
using namespace Brimvault::detail;
using Brimvault::IconImageDecoder::Bitmaps;

namespace {

constexpr char PngSignature[] = "\x89PNG\r\n\x1a\n";

qint64 rowBytes(qint64 bits)
{
    return ((bits + 31) / 32) * 4;
}

Bitmaps decodePng(const QByteArray& image)
{
    QBuffer buffer;
    buffer.setData(image);
    buffer.open(QIODevice::ReadOnly);
    QImageReader reader(&buffer, "png");
    const QSize size = reader.size();
    if (!size.isValid() || size.width() > MaxDecodedSide || size.height() > MaxDecodedSide)
        return {};
    QImage picture;
    if (!reader.read(&picture) || picture.isNull())
        return {};
    Bitmaps out;
    out.composed = picture.convertToFormat(QImage::Format_ARGB32);
    out.colour = out.composed.convertToFormat(QImage::Format_RGB32);
    out.mask = QImage(out.composed.size(), QImage::Format_RGB32);
    for (int y = 0; y < out.composed.height(); ++y) {
        const QRgb* src = reinterpret_cast<const QRgb*>(out.composed.constScanLine(y));
        QRgb* dst = reinterpret_cast<QRgb*>(out.mask.scanLine(y));
        for (int x = 0; x < out.composed.width(); ++x)
            dst[x] = qAlpha(src[x]) < 128 ? qRgb(255, 255, 255) : qRgb(0, 0, 0);
    }
    return out;
}

struct BitmapLayout {
    int width = 0;
    int height = 0;
    bool bottomUp = true;
    int bitCount = 0;
    qint64 palette = 0; // offset of the palette
    qint64 paletteCount = 0;
    qint64 colourBits = 0;
    qint64 colourRow = 0;
    qint64 maskBits = 0;
    qint64 maskRow = 0;
};

std::optional<BitmapLayout> layoutOf(const ByteReader& reader)
{
    const auto headerSize = reader.u32(0);
    const auto width = reader.i32(BmpWidth);
    const auto height = reader.i32(BmpHeight);
    const auto bitCount = reader.u16(BmpBitCount);
    const auto compression = reader.u32(BmpCompression);
    const auto clrUsed = reader.u32(BmpClrUsed);
    if (!headerSize || *headerSize < BmpHeaderSize || !clrUsed)
        return std::nullopt;
    BitmapLayout layout;
    layout.width = *width;
    // Colour bits and mask are stacked: the icon is half the bitmap's height.
    const qint64 stacked = *height;
    layout.bottomUp = stacked > 0;
    layout.height = int(qAbs(stacked) / 2);
    layout.bitCount = *bitCount;
    if (layout.width <= 0 || layout.height <= 0 || layout.width > MaxDecodedSide || layout.height > MaxDecodedSide)
        return std::nullopt;
    switch (layout.bitCount) {
    case 1:
    case 4:
    case 8:
        layout.paletteCount = *clrUsed != 0 ? qint64(*clrUsed) : qint64(1) << layout.bitCount;
        break;
    case 16:
    case 24:
    case 32:
        layout.paletteCount = *clrUsed;
        break;
    default:
        return std::nullopt;
    }
    if (*compression != 0 && !(*compression == BmpBitFields && (layout.bitCount == 16 || layout.bitCount == 32)))
        return std::nullopt;
    layout.palette = qint64(*headerSize) + (*compression == BmpBitFields && *headerSize == BmpHeaderSize ? 12 : 0);
    layout.colourBits = layout.palette + 4 * layout.paletteCount;
    layout.colourRow = rowBytes(qint64(layout.bitCount) * layout.width);
    layout.maskBits = layout.colourBits + layout.colourRow * layout.height;
    layout.maskRow = rowBytes(layout.width);
    if (!reader.contains(layout.colourBits, layout.colourRow * layout.height))
        return std::nullopt;
    return layout;
}

QRgb paletteColour(const ByteReader& reader, const BitmapLayout& layout, quint32 index)
{
    if (index >= layout.paletteCount)
        return qRgb(0, 0, 0);
    const qint64 at = layout.palette + 4 * qint64(index);
    return qRgb(reader.u8(at + 2).value_or(0), reader.u8(at + 1).value_or(0), reader.u8(at).value_or(0));
}

// The colour of pixel x in a row; alpha is the stored byte for 32-bit images, else 255.
QRgb pixelAt(const ByteReader& reader, const BitmapLayout& layout, qint64 row, int x)
{
    switch (layout.bitCount) {
    case 1:
        return paletteColour(reader, layout, (*reader.u8(row + x / 8) >> (7 - x % 8)) & 1);
    case 4:
        return paletteColour(reader, layout, (*reader.u8(row + x / 2) >> (x % 2 ? 0 : 4)) & 0xF);
    case 8:
        return paletteColour(reader, layout, *reader.u8(row + x));
    case 16: {
        const quint16 v = *reader.u16(row + 2 * qint64(x));
        return qRgb(((v >> 10) & 0x1F) * 255 / 31, ((v >> 5) & 0x1F) * 255 / 31, (v & 0x1F) * 255 / 31);
    }
    case 24:
        return qRgb(
            *reader.u8(row + 3 * qint64(x) + 2), *reader.u8(row + 3 * qint64(x) + 1), *reader.u8(row + 3 * qint64(x)));
    default:
        return qRgba(*reader.u8(row + 4 * qint64(x) + 2), *reader.u8(row + 4 * qint64(x) + 1),
            *reader.u8(row + 4 * qint64(x)), *reader.u8(row + 4 * qint64(x) + 3));
    }
}

Bitmaps decodeBitmap(const QByteArray& image)
{
    const ByteReader reader {QByteArrayView(image)};
    const auto layout = layoutOf(reader);
    if (!layout)
        return {};
    // An image without an AND mask is drawn opaque.
    const bool hasMask = reader.contains(layout->maskBits, layout->maskRow * layout->height);
    Bitmaps out;
    out.colour = QImage(layout->width, layout->height, QImage::Format_RGB32);
    out.mask = QImage(layout->width, layout->height, QImage::Format_RGB32);
    out.composed = QImage(layout->width, layout->height, QImage::Format_ARGB32);
    if (out.colour.isNull() || out.mask.isNull() || out.composed.isNull())
        return {};
    bool anyAlpha = false;
    for (int y = 0; y < layout->height; ++y) {
        const int stored = layout->bottomUp ? layout->height - 1 - y : y;
        const qint64 colourRow = layout->colourBits + layout->colourRow * stored;
        const qint64 maskRow = layout->maskBits + layout->maskRow * stored;
        QRgb* colour = reinterpret_cast<QRgb*>(out.colour.scanLine(y));
        QRgb* mask = reinterpret_cast<QRgb*>(out.mask.scanLine(y));
        QRgb* composed = reinterpret_cast<QRgb*>(out.composed.scanLine(y));
        for (int x = 0; x < layout->width; ++x) {
            const QRgb pixel = pixelAt(reader, *layout, colourRow, x);
            const bool transparent = hasMask && ((*reader.u8(maskRow + x / 8) >> (7 - x % 8)) & 1);
            colour[x] = pixel | 0xFF000000u;
            mask[x] = transparent ? qRgb(255, 255, 255) : qRgb(0, 0, 0);
            anyAlpha = anyAlpha || (layout->bitCount == 32 && qAlpha(pixel) != 0);
            // Where the mask is set, the screen shows through; inverting it is not something a picture can hold.
            composed[x] = transparent ? qRgba(0, 0, 0, 0) : (pixel | 0xFF000000u);
        }
    }
    // A 32-bit image that carries alpha is drawn by its alpha, not its mask.
    if (anyAlpha) {
        for (int y = 0; y < layout->height; ++y) {
            const int stored = layout->bottomUp ? layout->height - 1 - y : y;
            const qint64 colourRow = layout->colourBits + layout->colourRow * stored;
            QRgb* composed = reinterpret_cast<QRgb*>(out.composed.scanLine(y));
            for (int x = 0; x < layout->width; ++x)
                composed[x] = pixelAt(reader, *layout, colourRow, x);
        }
    }
    return out;
}

} // namespace

Bitmaps Decode(const QByteArray& image)
{
    return image.startsWith(QByteArrayView(PngSignature, 8)) ? decodePng(image) : decodeBitmap(image);
}

} // namespace IconTest::ReferenceIconDecoder
