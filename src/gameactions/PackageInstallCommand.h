#pragma once

#include <QString>

namespace Brimvault {

// The "Install game..." command once the package is chosen: runs the companion service with "-I" and the
// quoted package path, showing its window and waiting for it while events keep running. True when the list
// must be rebuilt (the service ran to its end, whatever its exit code); false after "There was an error! The
// game isn't installed!" was shown because the service could not be started or the wait failed.
bool InstallGamePackage(const QString& packagePath);

// The command line handed to the service for a package.
QString InstallCommandLine(const QString& packagePath);

// The install dialog's title ("Install game" in the language in force) and filter ("BVXPAK files
// (*.bvxpak)|*.bvxpak").
QString InstallDialogTitle();
QString InstallDialogFilter();

// The folder the install dialog opens in: the last package's folder, at first the user's documents.
class InstallFolderMemory {
public:
    QString dialogFolder();
    void packageChosen(const QString& packagePath);

private:
    QString m_lastFolder;
};

} // namespace Brimvault
