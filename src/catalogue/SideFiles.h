#pragma once

#include <QHash>
#include <QString>
#include <QStringList>

namespace Brimvault {

// The system's own files beside the games (info files, icons) found by name without regard to case, as on
// Windows: a game unpacked from an archive made there may spell them any way. One listing per folder
// serves every name asked for in it, instead of a file look-up per spelling.
class SideFiles {
public:
    // Keeps the names of a listing made anyway (the folder walk) for the folder, until the next one: the walk
    // hands on a folder's games before it lists the next folder.
    void remember(const QString& folder, const QStringList& files);
    // The file of that name in the folder (with its separator), spelled as on disk; a folder not remembered
    // is listed once. Empty when there is none.
    QString find(const QString& folder, const QString& name);
    void clear()
    {
        m_folders.clear();
        m_walked = {};
    }

    // The name as it lies among `files`: the exact spelling first, else the first equal apart from case.
    static QString matchName(const QStringList& files, const QString& name);

private:
    struct Folder {
        QString path;
        QStringList names;
    };
    // Per folder its info files and icons only: a handful of names, so a scan beats a hash in time and room.
    static QStringList sideFilesAmong(const QStringList& files);

    Folder m_walked; // the folder the walk handed on last
    QHash<QString, QStringList> m_folders; // folders listed here, for games outside the walk
};

} // namespace Brimvault
