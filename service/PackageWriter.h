#pragma once

#include <QString>

namespace Brimvault {

// Builds a game package from a game folder: a ZIP archive whose one top-level folder is the game folder's
// name. The folder must hold a game file (.exe or .swf) directly; links and special files are refused, as
// installing would refuse them. The package is written beside its final name and renamed when complete.
// Returns the reason for failing, or an empty text.
QString PackGameFolder(const QString& gameFolder, const QString& packagePath);

} // namespace Brimvault
