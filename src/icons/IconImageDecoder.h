#pragma once

#include <QImage>

class QByteArray;

namespace Brimvault {

struct IconDirEntry;

// Turns one icon image (a bitmap with its AND mask, or an embedded PNG) into pictures.
namespace IconImageDecoder {

struct Bitmaps {
    QImage colour; // the colour bits alone, opaque (RGB32)
    QImage mask; // the AND mask: white where the screen shows through (RGB32, black and white)
    QImage composed; // both together, with transparency (ARGB32)
};

// Null images when the bytes do not hold a picture this decoder understands.
Bitmaps Decode(const QByteArray& image);
// The composed picture alone, as Decode gives it; cheaper when the separate bitmaps are not drawn.
QImage DecodePicture(const QByteArray& image);

bool IsPng(const QByteArray& image);
// A bitmap image (not PNG) whose header and bits hold together: DecodePicture gives it a picture.
bool IsSoundBitmap(const QByteArray& image);

} // namespace IconImageDecoder

} // namespace Brimvault
