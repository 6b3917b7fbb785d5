#pragma once

#include <QString>
#include <QStringList>

inline QString ProgramPath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault");
}
inline QString ServicePath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService");
}

// Starts the real service with the arguments in the calling process's environment and waits a minute for it;
// the exit code, or -1 when it did not end. Standard output and error, merged, go to output.
int RunService(const QStringList& arguments, QString* output);
