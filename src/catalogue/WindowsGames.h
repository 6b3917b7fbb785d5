#pragma once

#include <QStringList>

namespace Brimvault {

struct CatalogueLocations;

namespace WindowsGames {

// The games that come with Windows, in list order: the classic card and puzzle games (Windows folder,
// else its system32), the "Microsoft Games" folder of Vista and later or the Gaming Zone folder before
// them, and Pinball from the first drive that has it.
QStringList Files(const CatalogueLocations& locations);

// Where a drive's root lies: "D:\" on Windows; elsewhere the drive's link in the Wine prefix
// (WINEPREFIX, else ~/.wine) under dosdevices, with "/".
QString DriveRoot(QChar letter);

} // namespace WindowsGames

} // namespace Brimvault
