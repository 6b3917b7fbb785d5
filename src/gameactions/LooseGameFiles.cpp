#include "gameactions/LooseGameFiles.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringList>

namespace Brimvault {

namespace {

bool belongsToGame(const QString& fileName, const QString& gameFileName)
{
    const qsizetype dot = gameFileName.indexOf(u'.');
    if (dot >= 0)
        return fileName.startsWith(gameFileName.left(dot + 1), Qt::CaseInsensitive);
    // Without this a game file with no extension would take every file of the folder with it.
    return fileName.compare(gameFileName, Qt::CaseInsensitive) == 0
        || fileName.startsWith(gameFileName + u'.', Qt::CaseInsensitive);
}

QString backupName(const QString& path)
{
    return path + QStringLiteral(".bak");
}

} // namespace

bool RemoveLooseGameFiles(const QString& folder, const QString& gameFileName)
{
    if (gameFileName.isEmpty())
        return false;
    const QFileInfoList files = QDir(folder).entryInfoList(QDir::Files, QDir::Name);
    QStringList moved;
    for (const QFileInfo& file : files) {
        if (!belongsToGame(file.fileName(), gameFileName))
            continue;
        const QString path = file.absoluteFilePath();
        if (!QFile::rename(path, backupName(path))) {
            for (const QString& original : moved)
                QFile::rename(backupName(original), original);
            return false;
        }
        moved.append(path);
    }
    for (const QString& original : moved)
        QFile::remove(backupName(original));
    return true;
}

} // namespace Brimvault
