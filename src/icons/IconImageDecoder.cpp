#include "icons/IconImageDecoder.h"

#include "icons/ByteReader.h"
#include "icons/PeLayout.h"

#include <QBuffer>
#include <QByteArray>
#include <QImageReader>
#include <QtEndian>

#include <array>

namespace Brimvault::IconImageDecoder {

using namespace detail;

namespace {

constexpr char PngSignature[] = "\x89PNG\r\n\x1a\n";
constexpr QRgb Opaque = 0xFF000000u;
constexpr QRgb MaskShows = 0xFFFFFFFFu; // white: the screen shows through
constexpr QRgb MaskCovers = 0xFF000000u;

enum class Wanted { All, Composed };

qint64 rowBytes(qint64 bits)
{
    return ((bits + 31) / 32) * 4;
}

Bitmaps decodePng(const QByteArray& image, Wanted wanted)
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
    out.composed = std::move(picture).convertToFormat(QImage::Format_ARGB32);
    if (wanted == Wanted::Composed)
        return out;
    out.colour = out.composed.convertToFormat(QImage::Format_RGB32);
    out.mask = QImage(out.composed.size(), QImage::Format_RGB32);
    for (int y = 0; y < out.composed.height(); ++y) {
        const QRgb* src = reinterpret_cast<const QRgb*>(out.composed.constScanLine(y));
        QRgb* dst = reinterpret_cast<QRgb*>(out.mask.scanLine(y));
        for (int x = 0; x < out.composed.width(); ++x)
            dst[x] = qAlpha(src[x]) < 128 ? MaskShows : MaskCovers;
    }
    return out;
}

// Where the parts of a bitmap image lie. The pixel block (and the mask, when there is one) have been checked
// to lie wholly inside the image, so rows are read from them without further tests.
struct BitmapLayout {
    int width = 0;
    int height = 0;
    bool bottomUp = true;
    int bitCount = 0;
    qint64 palette = 0; // offset of the palette
    qint64 paletteCount = 0;
    qint64 colourRow = 0;
    qint64 maskRow = 0;
    QByteArrayView colourBlock;
    QByteArrayView maskBlock; // empty when the image has no AND mask
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
    const qint64 colourBits = layout.palette + 4 * layout.paletteCount;
    layout.colourRow = rowBytes(qint64(layout.bitCount) * layout.width);
    layout.maskRow = rowBytes(layout.width);
    const auto colourBlock = reader.bytes(colourBits, layout.colourRow * layout.height);
    if (!colourBlock)
        return std::nullopt;
    layout.colourBlock = *colourBlock;
    // An image without an AND mask is drawn opaque.
    layout.maskBlock
        = reader.bytes(colourBits + colourBlock->size(), layout.maskRow * layout.height).value_or(QByteArrayView());
    return layout;
}

// Indices past the palette's end are black, as are palette bytes past the image's end.
std::array<QRgb, 256> paletteOf(const ByteReader& reader, const BitmapLayout& layout)
{
    std::array<QRgb, 256> colours;
    colours.fill(qRgb(0, 0, 0));
    if (layout.bitCount > 8)
        return colours;
    const qint64 count = qMin<qint64>(layout.paletteCount, qint64(colours.size()));
    for (qint64 i = 0; i < count; ++i) {
        const qint64 at = layout.palette + 4 * i;
        colours[std::size_t(i)]
            = qRgb(reader.u8(at + 2).value_or(0), reader.u8(at + 1).value_or(0), reader.u8(at).value_or(0));
    }
    return colours;
}

// One stored row of colour bits into pixels; alpha is the stored byte for 32-bit images, else 255.
void decodeRow(const BitmapLayout& layout, const std::array<QRgb, 256>& palette, const uchar* row, QRgb* out)
{
    const int width = layout.width;
    switch (layout.bitCount) {
    case 1:
        for (int x = 0; x < width; ++x)
            out[x] = palette[(row[x / 8] >> (7 - x % 8)) & 1];
        return;
    case 4:
        for (int x = 0; x < width; ++x)
            out[x] = palette[(row[x / 2] >> (x % 2 ? 0 : 4)) & 0xF];
        return;
    case 8:
        for (int x = 0; x < width; ++x)
            out[x] = palette[row[x]];
        return;
    case 16:
        for (int x = 0; x < width; ++x) {
            const quint16 v = qFromLittleEndian<quint16>(row + 2 * x);
            out[x] = qRgb(((v >> 10) & 0x1F) * 255 / 31, ((v >> 5) & 0x1F) * 255 / 31, (v & 0x1F) * 255 / 31);
        }
        return;
    case 24:
        for (int x = 0; x < width; ++x)
            out[x] = qRgb(row[3 * x + 2], row[3 * x + 1], row[3 * x]);
        return;
    default:
        // Blue, green, red, alpha in memory is QRgb read little-endian.
        for (int x = 0; x < width; ++x)
            out[x] = qFromLittleEndian<quint32>(row + 4 * x);
        return;
    }
}

bool maskBit(const uchar* maskRow, int x)
{
    return (maskRow[x / 8] >> (7 - x % 8)) & 1;
}

// Where the mask is set the screen shows through (inverting it is not something a picture can hold);
// elsewhere the pixel is opaque. Kept apart from the rest so that the loops stay plain.
void applyMask(QRgb* pixels, const uchar* maskRow, int width)
{
    if (!maskRow) {
        for (int x = 0; x < width; ++x)
            pixels[x] |= Opaque;
        return;
    }
    for (int x = 0; x < width; ++x)
        pixels[x] = maskBit(maskRow, x) ? qRgba(0, 0, 0, 0) : (pixels[x] | Opaque);
}

bool anyAlphaIn(const QRgb* pixels, int width)
{
    QRgb seen = 0;
    for (int x = 0; x < width; ++x)
        seen |= pixels[x];
    return qAlpha(seen) != 0;
}

Bitmaps decodeBitmap(const QByteArray& image, Wanted wanted)
{
    const ByteReader reader {QByteArrayView(image)};
    const auto layout = layoutOf(reader);
    if (!layout)
        return {};
    const bool all = wanted == Wanted::All;
    const int width = layout->width;
    Bitmaps out;
    out.composed = QImage(width, layout->height, QImage::Format_ARGB32);
    if (all) {
        out.colour = QImage(width, layout->height, QImage::Format_RGB32);
        out.mask = QImage(width, layout->height, QImage::Format_RGB32);
    }
    if (out.composed.isNull() || (all && (out.colour.isNull() || out.mask.isNull())))
        return {};
    const std::array<QRgb, 256> palette = paletteOf(reader, *layout);
    const auto* colourBits = reinterpret_cast<const uchar*>(layout->colourBlock.data());
    const auto* maskBits = reinterpret_cast<const uchar*>(layout->maskBlock.data());
    const auto maskRowOf = [&](int y) -> const uchar* {
        const int stored = layout->bottomUp ? layout->height - 1 - y : y;
        return layout->maskBlock.isEmpty() ? nullptr : maskBits + layout->maskRow * stored;
    };
    const auto composedRow = [&](int y) { return reinterpret_cast<QRgb*>(out.composed.scanLine(y)); };
    bool anyAlpha = false;
    for (int y = 0; y < layout->height; ++y) {
        const int stored = layout->bottomUp ? layout->height - 1 - y : y;
        QRgb* composed = composedRow(y);
        decodeRow(*layout, palette, colourBits + layout->colourRow * stored, composed);
        const uchar* maskRow = maskRowOf(y);
        if (all) {
            auto* colour = reinterpret_cast<QRgb*>(out.colour.scanLine(y));
            auto* mask = reinterpret_cast<QRgb*>(out.mask.scanLine(y));
            for (int x = 0; x < width; ++x) {
                colour[x] = composed[x] | Opaque;
                mask[x] = maskRow && maskBit(maskRow, x) ? MaskShows : MaskCovers;
            }
        }
        // Alpha pixels keep their stored value until we know whether the image uses alpha at all.
        if (layout->bitCount == 32)
            anyAlpha = anyAlpha || anyAlphaIn(composed, width);
        else
            applyMask(composed, maskRow, width);
    }
    // A 32-bit image that carries alpha is drawn by its alpha, not its mask.
    if (layout->bitCount == 32 && !anyAlpha) {
        for (int y = 0; y < layout->height; ++y)
            applyMask(composedRow(y), maskRowOf(y), width);
    }
    return out;
}

} // namespace

bool IsPng(const QByteArray& image)
{
    return image.startsWith(QByteArrayView(PngSignature, 8));
}

bool IsSoundBitmap(const QByteArray& image)
{
    return !IsPng(image) && layoutOf(ByteReader(QByteArrayView(image))).has_value();
}

Bitmaps Decode(const QByteArray& image)
{
    return IsPng(image) ? decodePng(image, Wanted::All) : decodeBitmap(image, Wanted::All);
}

QImage DecodePicture(const QByteArray& image)
{
    return (IsPng(image) ? decodePng(image, Wanted::Composed) : decodeBitmap(image, Wanted::Composed)).composed;
}

} // namespace Brimvault::IconImageDecoder
