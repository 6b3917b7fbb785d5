#pragma once

#include <QDir>
#include <QFile>
#include <QList>
#include <QString>
#include <QStringList>
#include <utility>

// What the launch recorder (tests/gameactions/launchrecorder.cpp) wrote: one entry per start of a program
// copied from it, in <folder>/<program file name>.record.
struct LaunchRecord {
    QString program;
    QString workingFolder;
    QStringList arguments;
};

inline QList<LaunchRecord> ReadLaunchRecords(const QString& recordFolder, const QString& programFileName)
{
    QFile file(recordFolder + u'/' + programFileName + QStringLiteral(".record"));
    QList<LaunchRecord> records;
    if (!file.open(QIODevice::ReadOnly))
        return records;
    LaunchRecord current;
    for (const QString& line : QString::fromLocal8Bit(file.readAll()).split(u'\n', Qt::SkipEmptyParts)) {
        if (line.startsWith(QStringLiteral("program=")))
            current.program = line.mid(8);
        else if (line.startsWith(QStringLiteral("cwd=")))
            current.workingFolder = line.mid(4);
        else if (line.startsWith(QStringLiteral("arg=")))
            current.arguments.append(line.mid(4));
        else if (line == QStringLiteral("end"))
            records.append(std::exchange(current, {}));
    }
    return records;
}

// Copies the recorder to path under another name, keeping it executable.
inline bool InstallRecorder(const QString& recorder, const QString& path)
{
    QDir().mkpath(path.left(path.lastIndexOf(u'/')));
    QFile::remove(path);
    return QFile::copy(recorder, path)
        && QFile::setPermissions(path, QFile::permissions(path) | QFileDevice::ExeOwner | QFileDevice::ExeUser);
}
