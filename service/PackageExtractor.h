#pragma once

#include <QString>
#include <functional>

namespace Brimvault {

class PackageArchive;
struct PackagePlan;

// Called while unpacking with the bytes written so far and the total; false asks to stop.
using ProgressCallback = std::function<bool(qint64 done, qint64 total)>;

// Unpacks a validated package into an empty folder that belongs to this install alone. Every header is
// checked again against the plan and every entry's data against its declared size, since headers can lie.
// Returns the reason for stopping, or an empty text; on failure the folder holds partial work the caller
// removes.
QString ExtractPackage(
    PackageArchive& archive, const PackagePlan& plan, const QString& targetFolder, const ProgressCallback& progress);

} // namespace Brimvault
