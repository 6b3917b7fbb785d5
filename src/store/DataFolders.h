#pragma once

#include <QString>

namespace Brimvault::DataFolders {

// The program's data folders below the all-users application-data folder. The sub-paths are kept
// Windows-style ("\Brimvault\Icons\", see CatalogueKeys) and become "/Brimvault/Icons/" elsewhere, so the
// results are real paths with a trailing separator. When the system has no such folder (empty or blank),
// the result is empty: callers then skip the folder rather than write anywhere else.

QString DataFolder(const QString& windowsSubPath);
QString GamesFolder();
QString IconsFolder();
QString ReclamaFolder();

} // namespace Brimvault::DataFolders
