#pragma once

#include <QString>

// The least any program must do to show a generated library: list the folders the window lists and read
// every file it reads (each game's info file, each cached icon, the settings file) with plain reads and
// nothing else. Fills and listings are set beside it as ratios.
namespace Brimvault::ReadFloor {

// Milliseconds for one such pass over the library the program's locations point at (the median of runs),
// with the file cache as warm as the measurement it is compared with; -1 when a file could not be read.
double milliseconds(const QString& addedRoot, int runs);

} // namespace Brimvault::ReadFloor
