#include "Packages.h"

#include <QProcess>

bool CraftPackage(const QString& kind, const QString& out)
{
    QProcess python;
    python.start(
        QStringLiteral("python3"), {QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/service/craft_package.py"), kind, out});
    return python.waitForFinished(120000) && python.exitStatus() == QProcess::NormalExit && python.exitCode() == 0;
}
