#pragma once

#include "icons/IconImageDecoder.h"

class QByteArray;

namespace IconTest::ReferenceIconDecoder {

// Decodes one icon image pixel by pixel, each byte read through the bounds-checked reader.
Brimvault::IconImageDecoder::Bitmaps Decode(const QByteArray& image);

} // namespace IconTest::ReferenceIconDecoder
