#pragma once

#include <QByteArray>
#include <QString>

namespace Brimvault::modLocalizer {

// The Windows code page that fonts of a character set use (204 gives 1251, 238 gives 1250, 0 gives 1252).
int CodePageForCharset(int charset);

// Language files written on Windows are in the code page of their character set; files saved by a modern
// editor are UTF-8. Valid UTF-8 (a leading byte order mark is dropped) wins; anything else is decoded with
// the code page of the character set.
QString DecodeLanguageFileBytes(const QByteArray& bytes, int charset);

// Decodes with one code page: through Qt's converters when they know it, else through our own tables for
// 1250, 1251 and 1252, else as Latin-1. Never fails.
QString DecodeCodePage(const QByteArray& bytes, int codePage);

// The byte of one character in a single-byte code page, -1 when the code page cannot write it alone.
int EncodeCharacter(QChar character, int codePage);

} // namespace Brimvault::modLocalizer
