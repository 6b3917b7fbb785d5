#include "PackageLimits.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include <limits>

namespace Brimvault {

namespace {

// A missing, non-numeric or non-positive value keeps the default: a damaged setting must not switch a
// safety check off.
qint64 positiveSetting(QLatin1String key, qint64 defaultValue)
{
    bool ok = false;
    const qint64 value = GetSetting(AppTitle(), CatalogueKeys::SettingsSection, key).trimmed().toLongLong(&ok);
    return ok && value > 0 ? value : defaultValue;
}

} // namespace

PackageLimits PackageLimits::fromSettings()
{
    PackageLimits limits;
    constexpr qint64 megabyte = 1024 * 1024;
    const qint64 megabytes
        = positiveSetting(PackageLimitKeys::MaxUnpackedMegabytes, limits.maxUnpackedBytes / megabyte);
    limits.maxUnpackedBytes = megabytes > std::numeric_limits<qint64>::max() / megabyte
        ? std::numeric_limits<qint64>::max()
        : megabytes * megabyte;
    limits.maxRatio = positiveSetting(PackageLimitKeys::MaxCompressionRatio, limits.maxRatio);
    limits.maxEntries = positiveSetting(PackageLimitKeys::MaxEntries, limits.maxEntries);
    return limits;
}

} // namespace Brimvault
