#pragma once

#include <QString>
#include <QStringList>
#include <optional>

namespace Brimvault {

struct ResolvedCommand {
    QString program; // absolute path of what is executed
    QStringList arguments;
};

// A command line as typed at a prompt: a quoted first word is the program; an unquoted one may hold blanks,
// and the shortest blank-separated start of the line that names a program wins ("C:\My Games\a.exe -x").
// The rest is split like a typed command. The program is looked for in the program's own folder, then on the
// PATH. Elsewhere than on Windows, "name.exe" also finds our own native "name", and a Windows executable is
// handed to the compatibility runner. Empty when nothing can be started.
//
// The runner is a command line of its own ("wine64", "/opt/runner/run --quiet"), resolved like any other,
// with the executable and its arguments appended; an empty runner stands for "wine" found on the PATH.
std::optional<ResolvedCommand> ResolveCommandLine(const QString& commandLine);
std::optional<ResolvedCommand> ResolveCommandLine(const QString& commandLine, const QString& compatibilityRunner);

// The absolute path of the program a command names, found as above; empty when there is none.
QString FindProgram(const QString& name);

// Starts a command line without waiting, in the current folder; the process is on its own from then on.
// The window style is the show-window value of Windows and has no effect elsewhere. The new process's id,
// or nothing when it could not be started.
std::optional<qint64> StartCommandLine(const QString& commandLine, int windowStyle);
std::optional<qint64> StartCommandLine(const QString& commandLine, int windowStyle, const QString& compatibilityRunner);

} // namespace Brimvault
