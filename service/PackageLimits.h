#pragma once

#include <QLatin1String>
#include <QtGlobal>

namespace Brimvault {

// Bounds a package must keep before anything of it is written. Read from the settings store, section
// "Settings", so that an administrator can raise them for an unusually large game.
struct PackageLimits {
    qint64 maxUnpackedBytes = qint64(8192) * 1024 * 1024;
    qint64 maxRatio = 200;
    qint64 maxEntries = 100000;

    static PackageLimits fromSettings();
};

namespace PackageLimitKeys {
inline constexpr QLatin1String MaxUnpackedMegabytes("PackageMaxUnpackedMB");
inline constexpr QLatin1String MaxCompressionRatio("PackageMaxCompressionRatio");
inline constexpr QLatin1String MaxEntries("PackageMaxEntries");
} // namespace PackageLimitKeys

} // namespace Brimvault
