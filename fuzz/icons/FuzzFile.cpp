#include "FuzzFile.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <cstdlib>

namespace {

const QString& scratchPath()
{
    static const QString path = []() -> QString {
        const QString shm = QStringLiteral("/dev/shm");
        const QString dir = QDir(shm).exists() ? shm : QDir::tempPath();
        return dir + QStringLiteral("/brimvault-fuzz-") + QString::number(QCoreApplication::applicationPid());
    }();
    return path;
}

void removeScratch()
{
    QFile::remove(scratchPath());
}

} // namespace

QString WriteFuzzInput(const uint8_t* data, size_t size)
{
    static const bool cleanupRegistered = std::atexit(removeScratch) == 0;
    Q_UNUSED(cleanupRegistered);
    QFile file(scratchPath());
    if (file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        file.write(reinterpret_cast<const char*>(data), qint64(size));
    return scratchPath();
}
