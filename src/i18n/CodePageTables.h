#pragma once

#include <QByteArray>
#include <QString>

namespace Brimvault::modLocalizer::detail {

// True for the code pages that have a table here (1250, 1251, 1252).
bool HasCodePageTable(int codePage);

// Decodes through the table: bytes below 0x80 are ASCII, the upper half comes from the table. Bytes that the
// code page leaves undefined map to the control character of the same value, as Windows does.
QString DecodeWithCodePageTable(const QByteArray& bytes, int codePage);

// The byte of one character in a code page that has a table here, -1 when the code page cannot write it.
int EncodeWithCodePageTable(QChar character, int codePage);

} // namespace Brimvault::modLocalizer::detail
