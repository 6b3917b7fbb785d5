#pragma once

#include <QStringList>

// Windows executables and libraries installed on this machine (mingw runtimes, Python launchers, Wine): PE files
// nobody here built. `firstFolders` and BRIMVAULT_PE_CORPUS (colon-separated) are searched first; one file per
// distinct content, at most maxFiles, sorted by path.
QStringList RealPeFiles(const QStringList& firstFolders, int maxFiles);
