#pragma once

#include "DiskSpace.h"
#include "PackageExtractor.h"

#include <QString>

namespace Brimvault {

struct InstallResult {
    QString problem; // empty on success
    QString installedPath; // the game's folder in the games folder
    bool replaced = false; // an older copy of the game was replaced
    bool signalled = false; // "Commands"/"NewGameInstalled" was set
    bool cancelled = false; // the user stopped it; nothing else went wrong

    bool succeeded() const { return problem.isEmpty(); }
};

// Phases an install reports to its user before and after the unpacking that ProgressCallback follows.
enum class InstallPhase { Checking, Unpacking, Finishing };
using PhaseCallback = std::function<void(InstallPhase phase, const QString& gameFolder)>;

// Installs a game package into the games folder and tells the program through the settings store. The
// games folder changes only in the final rename: on any failure it stays exactly as it was, and a game being
// reinstalled keeps its old copy.
InstallResult InstallPackage(
    const QString& packagePath, const ProgressCallback& progress = {}, const PhaseCallback& phase = {});

} // namespace Brimvault
