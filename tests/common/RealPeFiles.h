#pragma once

#include <QStringList>

namespace Brimvault {

// Windows executables and libraries that Debian packages install on this machine (the mingw runtimes, Python
// launchers, Wine), for tests and benchmarks that want PE files nobody here built. `firstFolders` and the
// folders of BRIMVAULT_PE_CORPUS (colon-separated) are searched first. One file per distinct content, at most
// maxFiles, sorted by path.
QStringList RealPeFiles(const QStringList& firstFolders, int maxFiles);

} // namespace Brimvault
