#include "catalogue/WindowsGames.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/FolderWalk.h"
#include "catalogue/GameFileRules.h"

#include <QDir>
#include <QFileInfo>

namespace Brimvault::WindowsGames {

namespace {

bool isFile(const QString& path)
{
    return QFileInfo(FileSystemPath(path)).isFile();
}

bool isFolder(const QString& path)
{
    return !path.isEmpty() && QFileInfo(FileSystemPath(path)).isDir();
}

QString classicGame(const QString& windowsFolder, const QString& name)
{
    if (windowsFolder.isEmpty())
        return QString();
    const QChar separator = NativeSeparator();
    const QString direct = windowsFolder + separator + name + QStringLiteral(".exe");
    if (isFile(direct))
        return direct;
    const QString inSystem
        = windowsFolder + separator + QStringLiteral("system32") + separator + name + QStringLiteral(".exe");
    return isFile(inSystem) ? inSystem : QString();
}

QString microsoftGamesFolder(const CatalogueLocations& locations)
{
    const QString programFiles = locations.programFiles;
    if (programFiles.isEmpty())
        return QString();
    const QChar separator = NativeSeparator();
    if (locations.windowsMajorVersion <= 5)
        return programFiles + separator + QStringLiteral("MSN Gaming Zone");
    const QString games = separator + QStringLiteral("Microsoft Games");
    QString without86 = programFiles;
    without86.remove(QStringLiteral(" (x86)"));
    const QStringList candidates {
        programFiles + games, programFiles + QStringLiteral(" (x86)") + games, without86 + games};
    for (const QString& candidate : candidates) {
        if (isFolder(candidate))
            return candidate;
    }
    return QString();
}

QString pinball()
{
    const QChar separator = NativeSeparator();
    const QString relative = QStringList {QStringLiteral("Program Files"), QStringLiteral("Windows NT"),
        QStringLiteral("Pinball"), QStringLiteral("PINBALL.exe")}
                                 .join(separator);
    for (char16_t letter = u'C'; letter <= u'Z'; ++letter) {
        const QString root = DriveRoot(QChar(letter));
        if (!root.isEmpty() && isFile(root + relative))
            return root + relative;
    }
    return QString();
}

} // namespace

QString DriveRoot(QChar letter)
{
#ifdef Q_OS_WIN
    return letter + QStringLiteral(":\\");
#else
    QString prefix = qEnvironmentVariable("WINEPREFIX");
    if (prefix.isEmpty())
        prefix = QDir::homePath() + QStringLiteral("/.wine");
    return QDir::cleanPath(prefix) + QStringLiteral("/dosdevices/") + letter.toLower() + QStringLiteral(":/");
#endif
}

QStringList Files(const CatalogueLocations& locations)
{
    QStringList files;
    for (const char16_t* name : {u"spider", u"mshearts", u"sol", u"winmine", u"freecell"}) {
        const QString game = classicGame(locations.windowsFolder, QString::fromUtf16(name));
        if (!game.isEmpty())
            files.append(game);
    }

    const QString gamesFolder = microsoftGamesFolder(locations);
    if (isFolder(gamesFolder)) {
        FolderWalk::WalkFolderTree(gamesFolder + NativeSeparator(), [&files](const FolderWalk::WalkedFolder& folder) {
            for (const QString& name : FolderWalk::FilesOf(folder)) {
                if (GameFileRules::HasExtension(name, QLatin1String("exe"))
                    && name.toUpper() != QLatin1String("ZCLIENTM.EXE"))
                    files.append(folder.path + name);
            }
            return true;
        });
    }

    const QString pinballGame = pinball();
    if (!pinballGame.isEmpty())
        files.append(pinballGame);
    return files;
}

} // namespace Brimvault::WindowsGames
