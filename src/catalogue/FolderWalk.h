#pragma once

#include <QList>
#include <QPair>
#include <QString>
#include <QStringList>

#include <functional>
#include <optional>

namespace Brimvault::FolderWalk {

// Folder listings in the order the file system gives them, never sorted. Hidden entries are left out, as
// the shell's plain listing leaves out hidden and system entries. Folders are written with their trailing
// separator; the separator a folder already ends with is used for the folders below it.

struct Listing {
    QStringList files; // plain files
    QStringList folders; // sub-folder names, without separator
    std::optional<QPair<quint64, quint64>> identity; // device and node, where the system has them
};

// Empty when the folder cannot be read.
Listing ListFolder(const QString& folder);

// One folder found by the walk, with its files when the walk had to list it anyway.
struct WalkedFolder {
    QString path;
    std::optional<QStringList> files;
};

// Takes each folder the walk has settled; false stops the walk.
using FolderSink = std::function<bool(const WalkedFolder&)>;

// Every folder below `folder`, not the folder itself: its children, then the subtree of the first child
// (its children first), then that of the second, and so on. A folder whose "DirInfo.bvxinf" (in any letter
// case) says "StopDir" = "Yes" is collected by its parent but nothing below it is.
QList<WalkedFolder> CollectSubfolders(const QString& folder);
// The same folders in the same order, each handed to `found` as soon as its place in that order and its
// files are known, so that the first games can be shown while the walk goes on. False when stopped.
bool WalkSubfolders(const QString& folder, const FolderSink& found);
// The folder itself first, with the files of the one listing the walk makes of it, then WalkSubfolders' folders.
bool WalkFolderTree(const QString& folder, const FolderSink& found);

// The files of a walked folder: the listing the walk kept, else a fresh one.
QStringList FilesOf(const WalkedFolder& folder);

} // namespace Brimvault::FolderWalk
