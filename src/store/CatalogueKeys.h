#pragma once

#include <QLatin1String>

namespace Brimvault::CatalogueKeys {

// Settings store: application AppTitle(), then these sections and keys.
inline constexpr QLatin1String FilesSection("Files");
inline constexpr QLatin1String CountKey("Count");
inline constexpr QLatin1String FileKeyPrefix("File"); // "File" + n, n = 1, 2, ...
inline constexpr QLatin1String FilesNamesSection("FilesNames");
inline constexpr QLatin1String FileNameKeyPrefix("FileName"); // "FileName" + the same n

inline constexpr QLatin1String CommandsSection("Commands");
inline constexpr QLatin1String NewGameInstalledKey("NewGameInstalled");
inline constexpr QLatin1String NoNewGameInstalled("0");

inline constexpr QLatin1String LocaleSettingsSection("LocaleSettings");
inline constexpr QLatin1String LngFileNameKey("LngFileName");
inline constexpr QLatin1String DefaultLngFileName("English (Default)");
inline constexpr QLatin1String LngNikKey("LngNik");
inline constexpr QLatin1String DefaultLngNik("ENG");

inline constexpr QLatin1String SettingsSection("Settings");

// Info files beside games and in folders, in the record bag format.
inline constexpr QLatin1String InfoFileExtension(".bvxinf");
inline constexpr QLatin1String NameRecord("Name"); // also "Name" + "_" + LngNik
inline constexpr QLatin1String DirInfoFileName("DirInfo.bvxinf");
inline constexpr QLatin1String StopDirRecord("StopDir");
inline constexpr QLatin1String StopDirYes("Yes");

// Data folders below the all-users application-data folder, written Windows-style.
inline constexpr QLatin1String GamesSubPath("\\Brimvault\\");
inline constexpr QLatin1String IconsSubPath("\\Brimvault\\Icons\\");
inline constexpr QLatin1String ReclamaSubPath("\\Brimvault\\Reclama\\");

} // namespace Brimvault::CatalogueKeys
