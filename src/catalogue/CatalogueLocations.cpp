#include "catalogue/CatalogueLocations.h"

#include "store/DataFolders.h"
#include "support/PathFunctions.h"
#include "support/ProgramFolder.h"
#include "support/SystemFolders.h"

namespace Brimvault {

CatalogueLocations CatalogueLocations::fromSystem()
{
    CatalogueLocations locations;
    locations.gamesFolder = DataFolders::GamesFolder();
    locations.iconsFolder = DataFolders::IconsFolder();
    locations.programFolder = AddSlash(ProgramFolder());
    locations.windowsFolder = WindowsFolder();
    locations.programFiles = SpecialFolderPath(CSIDL_PROGRAM_FILES);
    locations.windowsMajorVersion = GetMajorWinVerNumber();
    return locations;
}

QChar NativeSeparator()
{
#ifdef Q_OS_WIN
    return u'\\';
#else
    return u'/';
#endif
}

QString FileSystemPath(const QString& path)
{
#ifdef Q_OS_WIN
    return path;
#else
    QString converted = path;
    return converted.replace(u'\\', u'/');
#endif
}

QString ProgramOwnFile()
{
    return (AddSlash(ProgramFolder()) + ProgramBaseName() + QStringLiteral(".exe")).toUpper();
}

} // namespace Brimvault
