#pragma once

#include "PackageLimits.h"
#include "PackagePlan.h"

#include <QSet>
#include <QString>

namespace Brimvault {

class PackageArchive;
struct EntryHeader;

// Checks every entry header of a package before anything is written: names that stay inside one game
// folder, plain files and folders only, sizes within the limits. Each check answers with the reason for
// refusing the package, or an empty text.
class PackageValidator {
public:
    PackageValidator(const PackageLimits& limits, qint64 packageBytes);

    QString addEntry(const EntryHeader& header);
    // Checks that need the whole package: a game file, the totals against the limits.
    QString finish();

    const PackagePlan& plan() const { return m_plan; }

    // Why a stored name cannot be unpacked safely on any system we run on; empty when it can.
    static QString pathProblem(const QString& path);
    static bool isGameFileName(const QString& name);

private:
    QString registerPath(const QString& path, bool folder);

    PackageLimits m_limits;
    qint64 m_packageBytes = 0;
    PackagePlan m_plan;
    QSet<QString> m_foldedFiles;
    QSet<QString> m_foldedFolders;
    bool m_hasGameFile = false;
};

// Reads every header of an opened package through a validator. On success `plan` holds the package.
QString ValidatePackage(PackageArchive& archive, const PackageLimits& limits, qint64 packageBytes, PackagePlan& plan);

} // namespace Brimvault
