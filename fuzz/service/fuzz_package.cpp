// Package bytes from outside, through libarchive's memory reader into validation; a package that passes is
// unpacked into a scratch folder. Whatever passes must keep the promises installing relies on.
#include "PackageArchive.h"
#include "PackageExtractor.h"
#include "PackageLimits.h"
#include "PackagePlan.h"
#include "PackageValidator.h"

#include <QDir>
#include <QDirIterator>
#include <QFileInfo>
#include <QTemporaryDir>

#include <cstdint>
#include <cstdlib>

using namespace Brimvault;

namespace {

void check(bool promise)
{
    if (!promise)
        std::abort();
}

// Nothing may land outside the scratch folder's game folder, and nothing but plain files and folders.
void checkUnpacked(const QString& scratch, const PackagePlan& plan)
{
    QDirIterator it(
        scratch, QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QFileInfo info(it.next());
        const QString relative = QDir(scratch).relativeFilePath(info.filePath());
        check(!info.isSymLink() && (info.isFile() || info.isDir()));
        check(relative == plan.gameFolder || relative.startsWith(plan.gameFolder + u'/'));
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    PackageLimits limits;
    limits.maxUnpackedBytes = 4 * 1024 * 1024;
    limits.maxEntries = 2000;

    PackageArchive archive;
    archive.openMemory(data, size);
    PackagePlan plan;
    if (!ValidatePackage(archive, limits, qint64(size), plan).isEmpty()) {
        check(plan.entries.isEmpty());
        return 0;
    }

    check(!plan.gameFolder.isEmpty() && !plan.gameFolder.startsWith(u'.'));
    check(plan.totalBytes <= limits.maxUnpackedBytes);
    qint64 total = 0;
    for (const PlannedEntry& entry : plan.entries) {
        check(PackageValidator::pathProblem(entry.path).isEmpty());
        check(entry.path == plan.gameFolder || entry.path.startsWith(plan.gameFolder + u'/'));
        check(entry.size >= 0 && (!entry.folder || entry.size == 0));
        total += entry.size;
    }
    check(total == plan.totalBytes);

    static QTemporaryDir scratchRoot;
    const QString scratch = scratchRoot.filePath(QStringLiteral("unpack"));
    QDir(scratch).removeRecursively();
    QDir().mkpath(scratch);
    PackageArchive again;
    again.openMemory(data, size);
    const QString problem = ExtractPackage(again, plan, scratch, [](qint64 done, qint64 all) {
        check(done <= all);
        return true;
    });
    checkUnpacked(scratch, plan);
    if (problem.isEmpty()) {
        for (const PlannedEntry& entry : plan.entries) {
            const QFileInfo info(scratch + u'/' + entry.path);
            check(entry.folder ? info.isDir() : info.isFile() && info.size() == entry.size);
        }
    }
    QDir(scratch).removeRecursively();
    return 0;
}
