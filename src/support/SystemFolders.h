#pragma once

#include <QString>

namespace Brimvault {

// Special-folder codes the program asks for.
inline constexpr int CSIDL_PERSONAL = 5;
inline constexpr int CSIDL_COMMON_APPDATA = 35;
inline constexpr int CSIDL_PROGRAM_FILES = 38;

// The folder itself, without a trailing separator; empty when the system has none.
// Windows: the shell's answer. Elsewhere:
//   CSIDL_COMMON_APPDATA  BRIMVAULT_COMMON_APPDATA, else the generic data location
//   CSIDL_PERSONAL        BRIMVAULT_PERSONAL, else the documents location
//   CSIDL_PROGRAM_FILES   BRIMVAULT_PROGRAM_FILES, else "drive_c/Program Files" of the Wine prefix
//                         (WINEPREFIX, else ~/.wine) when it exists, else empty
// A variable that is set wins even when it is empty: that is how a system without the folder is imitated.
QString SpecialFolderPath(int csidl);

// The folder followed by suffix ("\Brimvault\"); when the folder is empty or blank, the program's own
// folder without the suffix. The suffix is written Windows-style; on other systems its "\" become "/",
// so the result is a usable path there.
QString GetSpecialFolder(int csidl, const QString& suffix);

// The Windows folder: the "windir" variable, else "drive_c/windows" of the Wine prefix when it exists,
// else empty. No trailing separator.
QString WindowsFolder();

// The Windows major version; greater than 5 means Vista or later places. Asked once, then cached.
// Elsewhere BRIMVAULT_WINVER when it holds a positive number, else 10.
int GetMajorWinVerNumber();

// The same question without the cache.
int ReadMajorWinVerNumber();

} // namespace Brimvault
