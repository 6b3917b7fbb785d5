#pragma once

#include <QDateTime>
#include <QList>
#include <QString>

namespace Brimvault {

// A package as validation found it: every entry in archive order, all inside one game folder.
struct PlannedEntry {
    QString path; // relative, "/" separated, no trailing "/"
    bool folder = false;
    qint64 size = 0;
    QDateTime modified;
};

struct PackagePlan {
    QString gameFolder;
    QList<PlannedEntry> entries;
    qint64 totalBytes = 0;
    qint64 fileCount = 0;
};

} // namespace Brimvault
