#pragma once

#include <QString>

namespace Brimvault {

// The name under which a game's icon is cached: the upper-cased file name without extension, then the sum
// of the 8-bit character codes at the odd positions (1, 3, 5, ...) of the path as given, then the sum at
// the even positions. "C:\G.exe" gives "G325331". Empty when a sum leaves the signed 32-bit range.
QString IconCacheKey(const QString& path);

// The code page of the system's character set (1251 for Cyrillic, 1250 for Central European, ...).
int SystemCodePage();

// The 8-bit code of one character: its byte in the code page, "?" for a character it cannot write.
int EightBitCode(QChar character, int codePage);

// iconsFolder + IconCacheKey(path) + ".ico"; empty without a folder or a key.
QString IconCacheFile(const QString& iconsFolder, const QString& path);

} // namespace Brimvault
