#pragma once

#include <QString>

class QTextStream;

// The window-less command-line tools for icons and version information.
namespace Brimvault::IconCommands {

// Writes the main icon of an executable as an icon file. 0, or 1 with a one-line reason on err.
int ExtractIcon(const QString& sFile, const QString& sIconFile, QTextStream& err);
// Prints "Translation=XXXXXXXX" and the eight fields as Name=value lines. 0, or 1 when nothing could be read.
int PrintVersionInfo(const QString& sFile, QTextStream& out, QTextStream& err);

} // namespace Brimvault::IconCommands
