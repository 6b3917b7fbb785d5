#pragma once

#include <QString>

namespace Brimvault::GameFileRules {

// The tests that decide which files of a folder are games. Names are bare file names.

// "*Brimvault.exe*BrimvaultService.exe*uninst.exe*unins000.exe*UNWISE.EXE*spuninst.exe*"
QString ExclusionText();

// True when the name occurs anywhere inside the exclusion text, ignoring case. A name that is only a piece
// of it ("t.exe" inside "uninst.exe") is excluded as well.
bool IsExcludedName(const QString& name);

// True when the name contains "setup" or "install", ignoring case.
bool LooksLikeInstaller(const QString& name);

// The discovery scan: "*.exe" files that are neither excluded nor installers by name.
bool IsDiscoverableExecutable(const QString& name);
bool HasExtension(const QString& name, QLatin1String extension);

// The folder scan's extension test: ":" + extension + ":" inside ":exe:swf:".
bool HasAcceptedExtension(const QString& name);

// True when the file's version information can be read and its joined texts contain "setup" or "install".
bool IsInstallerByVersion(const QString& path);

} // namespace Brimvault::GameFileRules
