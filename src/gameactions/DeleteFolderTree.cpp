#include "gameactions/DeleteFolderTree.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace Brimvault {

namespace {

void deleteFile(const QFileInfo& entry)
{
    const QString path = entry.absoluteFilePath();
    if (!entry.isSymLink())
        QFile::setPermissions(path, entry.permissions() | QFileDevice::WriteOwner | QFileDevice::WriteUser);
    QFile::remove(path);
}

} // namespace

bool DeleteFolderTree(const QString& folder)
{
    QString path = folder;
    if (path.endsWith(u'\\') || path.endsWith(u'/'))
        path.chop(1);
    if (path.isEmpty())
        return false;
    const QFileInfo info(path);
    if (info.isSymLink())
        return QFile::remove(path);
    if (!info.isDir())
        return false;

    const QFileInfoList entries
        = QDir(path).entryInfoList(QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot);
    for (const QFileInfo& entry : entries) {
        if (entry.isDir() && !entry.isSymLink()) {
            if (!DeleteFolderTree(entry.absoluteFilePath()))
                return false;
        } else {
            deleteFile(entry);
        }
    }
    return QDir().rmdir(path);
}

} // namespace Brimvault
