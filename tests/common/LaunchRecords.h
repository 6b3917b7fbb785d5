#pragma once

#include "TestFiles.h"

#include <QFile>
#include <QList>
#include <QString>
#include <QStringList>

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
    for (const QString& line : QString::fromLocal8Bit(file.readAll()).split(u'\n', Qt::SkipEmptyParts)) {
        const QStringList fields = line.split(u'\t');
        records.append({fields.value(0), fields.value(1), fields.mid(2)});
    }
    return records;
}

// Copies the recorder to path under another name, keeping it executable.
inline bool InstallRecorder(const QString& recorder, const QString& path)
{
    return QFile::exists(recorder) && WriteExecutable(path, ReadFile(recorder));
}
