#include "GameInstaller.h"

#include "DiskSpace.h"
#include "PackageArchive.h"
#include "PackageLimits.h"
#include "PackagePlan.h"
#include "PackageValidator.h"
#include "StagingArea.h"

#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QDir>
#include <QFileInfo>

namespace Brimvault {

namespace {

constexpr QLatin1String RetiredFolder("retired");

QString quoted(const QString& text)
{
    return u'"' + text + u'"';
}

QString withoutTrailingSeparator(QString folder)
{
    while (folder.size() > 1 && (folder.endsWith(u'/') || folder.endsWith(u'\\')))
        folder.chop(1);
    return folder;
}

// The folder a reinstall replaces: the same name in any letter case, since on Windows that is one folder.
QString existingGameFolder(const QString& gamesFolder, const QString& gameFolder)
{
    const QStringList names
        = QDir(gamesFolder).entryList(QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot);
    for (const QString& name : names) {
        if (name.compare(gameFolder, Qt::CaseInsensitive) == 0)
            return name;
    }
    return QString();
}

QString freeSpaceProblem(const QString& gamesFolder, const PackagePlan& plan)
{
    // Where the free space cannot be known, a disk that fills while unpacking is caught there instead.
    const std::optional<qint64> available = FreeBytes(gamesFolder);
    const qint64 needed = RequiredFreeSpace(plan.totalBytes, plan.fileCount);
    if (available && *available < needed)
        return NotEnoughSpaceProblem(needed, available);
    return QString();
}

// Moves the unpacked game into place, retiring an older copy into the slot first so it can come back if
// the move fails. Runs under the games folder lock.
QString moveIntoPlace(const QString& gamesFolder, InstallSlot& slot, const QString& gameFolder, bool& replaced)
{
    QDir games(gamesFolder);
    const QString existing = existingGameFolder(gamesFolder, gameFolder);
    const QString retired = slot.path() + u'/' + RetiredFolder;
    if (!existing.isEmpty()) {
        const QFileInfo info(games.filePath(existing));
        if (info.isSymLink() || !info.isDir())
            return QStringLiteral("%1 in the games folder is not a game folder and was left as it is.")
                .arg(quoted(existing));
        if (!games.rename(existing, retired))
            return QStringLiteral("The game %1 is in use and cannot be replaced now. Close it and try again.")
                .arg(quoted(existing));
        replaced = true;
    }
    if (!games.rename(slot.path() + u'/' + gameFolder, games.filePath(gameFolder))) {
        if (replaced && !games.rename(retired, games.filePath(existing))) {
            // Never delete the only copy left of a game.
            const QString kept = slot.preserve();
            return QStringLiteral("The game could not be moved into the games folder, and its old copy could "
                                  "not be moved back: it is kept in %1.")
                .arg(quoted(QDir::toNativeSeparators(kept + u'/' + RetiredFolder)));
        }
        replaced = false;
        return QStringLiteral("The game could not be moved into the games folder.");
    }
    return QString();
}

QString unpackAndMove(const QString& packagePath, const QString& gamesFolder, const PackagePlan& plan,
    const ProgressCallback& progress, const PhaseCallback& phase, InstallResult& result)
{
    std::unique_ptr<InstallSlot> slot;
    {
        GamesFolderLock lock(gamesFolder);
        if (!lock.isLocked())
            return QStringLiteral("Another installation is busy with the games folder. Try again later.");
        slot = InstallSlot::create(gamesFolder);
    }
    if (!slot)
        return QStringLiteral("The games folder %1 cannot be written.").arg(quoted(gamesFolder));

    if (phase)
        phase(InstallPhase::Unpacking, plan.gameFolder);
    PackageArchive archive;
    if (!archive.openFile(packagePath))
        return QStringLiteral("The package can no longer be read (%1).").arg(archive.errorText());
    const ProgressCallback noticeCancel = [&](qint64 done, qint64 total) {
        result.cancelled = progress && !progress(done, total);
        return !result.cancelled;
    };
    if (QString problem = ExtractPackage(archive, plan, slot->path(), noticeCancel); !problem.isEmpty())
        return problem;

    if (phase)
        phase(InstallPhase::Finishing, plan.gameFolder);
    {
        GamesFolderLock lock(gamesFolder);
        if (!lock.isLocked())
            return QStringLiteral("Another installation is busy with the games folder. Try again later.");
        if (QString problem = moveIntoPlace(gamesFolder, *slot, plan.gameFolder, result.replaced); !problem.isEmpty())
            return problem;
    }
    result.installedPath = QDir(gamesFolder).filePath(plan.gameFolder);
    return QString();
}

} // namespace

InstallResult InstallPackage(const QString& packagePath, const ProgressCallback& progress, const PhaseCallback& phase)
{
    InstallResult result;
    const QString gamesFolder = withoutTrailingSeparator(DataFolders::GamesFolder());
    if (gamesFolder.isEmpty()) {
        result.problem = QStringLiteral("This system has no folder for installed games.");
        return result;
    }
    const QFileInfo package(packagePath);
    if (!package.isFile()) {
        result.problem = QStringLiteral("The package %1 cannot be found.").arg(quoted(packagePath));
        return result;
    }
    if (phase)
        phase(InstallPhase::Checking, QString());

    PackagePlan plan;
    {
        PackageArchive archive;
        if (!archive.openFile(package.absoluteFilePath())) {
            result.problem
                = QStringLiteral("The package is damaged or is not a game package (%1).").arg(archive.errorText());
            return result;
        }
        result.problem = ValidatePackage(archive, PackageLimits::fromSettings(), package.size(), plan);
        if (!result.succeeded())
            return result;
    }

    const bool gamesFolderExisted = QFileInfo(gamesFolder).isDir();
    if (!QDir().mkpath(gamesFolder)) {
        result.problem = QStringLiteral("The games folder %1 cannot be created.").arg(quoted(gamesFolder));
        return result;
    }
    result.problem = freeSpaceProblem(gamesFolder, plan);
    if (result.succeeded())
        result.problem = unpackAndMove(package.absoluteFilePath(), gamesFolder, plan, progress, phase, result);
    if (!result.succeeded()) {
        if (!gamesFolderExisted)
            QDir().rmdir(gamesFolder);
        return result;
    }

    result.signalled = SaveSetting(
        AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, QStringLiteral("1"));
    if (!result.signalled)
        result.problem = QStringLiteral("The game was installed, but Brimvault could not be told: its settings "
                                        "cannot be written. It will show the game at its next start.");
    return result;
}

} // namespace Brimvault
