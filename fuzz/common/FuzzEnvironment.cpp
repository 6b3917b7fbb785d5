#include "FuzzEnvironment.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <cstdlib>

namespace {

QString baseFolder()
{
    const QString shm = QStringLiteral("/dev/shm");
    return QFileInfo(shm).isWritable() ? shm : QDir::tempPath();
}

QString rootPath()
{
    return baseFolder() + QStringLiteral("/brimvault-fuzzenv-") + QString::number(QCoreApplication::applicationPid());
}

void removeTree()
{
    QDir(rootPath()).removeRecursively();
}

// A run that crashed or was stopped leaves its tree behind; the next run tidies up after it.
void removeTreesOfEndedRuns()
{
    const QString prefix = QStringLiteral("brimvault-fuzzenv-");
    QDir base(baseFolder());
    const QStringList trees = base.entryList({prefix + u'*'}, QDir::Dirs | QDir::NoDotAndDotDot);
    for (const QString& tree : trees) {
        bool ok = false;
        const qint64 pid = tree.mid(prefix.size()).toLongLong(&ok);
        if (ok && !QFileInfo::exists(QStringLiteral("/proc/") + QString::number(pid)))
            QDir(base.filePath(tree)).removeRecursively();
    }
}

} // namespace

FuzzEnvironment& FuzzEnvironment::instance()
{
    static FuzzEnvironment environment;
    return environment;
}

FuzzEnvironment::FuzzEnvironment()
    : m_root(rootPath())
{
    removeTreesOfEndedRuns();
    QDir(m_root).removeRecursively();
    for (const char* sub : {"settings", "commonappdata", "personal", "programfiles", "windows", "program"})
        QDir(m_root).mkpath(QString::fromLatin1(sub));
    qputenv("BRIMVAULT_SETTINGS_DIR", path(QStringLiteral("settings")).toLocal8Bit());
    qputenv("BRIMVAULT_COMMON_APPDATA", path(QStringLiteral("commonappdata")).toLocal8Bit());
    qputenv("BRIMVAULT_PERSONAL", path(QStringLiteral("personal")).toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_FILES", path(QStringLiteral("programfiles")).toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_DIR", path(QStringLiteral("program")).toLocal8Bit());
    qputenv("windir", path(QStringLiteral("windows")).toLocal8Bit());
    // The catalogue server root then comes from the settings, which is what is being read.
    qunsetenv("BRIMVAULT_CATALOGUE_ROOT");
    std::atexit(removeTree);
}

QString FuzzEnvironment::path(const QString& relative) const
{
    return m_root + u'/' + relative;
}

QString FuzzEnvironment::settingsFile() const
{
    return path(QStringLiteral("settings/Brimvault.ini"));
}

bool FuzzEnvironment::writeFile(const QString& relative, const QByteArray& bytes) const
{
    const QString file = path(relative);
    QDir().mkpath(QFileInfo(file).absolutePath());
    QFile out(file);
    return out.open(QIODevice::WriteOnly | QIODevice::Truncate) && out.write(bytes) == bytes.size();
}

void FuzzEnvironment::removeFile(const QString& relative) const
{
    QFile::remove(path(relative));
}
