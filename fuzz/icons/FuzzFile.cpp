#include "FuzzFile.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>

QString WriteFuzzInput(const uint8_t* data, size_t size)
{
    static const QString path = []() -> QString {
        const QString shm = QStringLiteral("/dev/shm");
        const QString dir = QDir(shm).exists() ? shm : QDir::tempPath();
        return dir + QStringLiteral("/brimvault-fuzz-") + QString::number(QCoreApplication::applicationPid());
    }();
    QFile file(path);
    if (file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        file.write(reinterpret_cast<const char*>(data), qint64(size));
    return path;
}
