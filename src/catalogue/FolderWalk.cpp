#include "catalogue/FolderWalk.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/SideFiles.h"
#include "store/CatalogueKeys.h"
#include "store/InfoFiles.h"

#include <QPair>
#include <QSet>

#ifdef Q_OS_WIN
#include <QDirIterator>
#else
#include <QFile>

#include <dirent.h>
#include <sys/stat.h>
#endif

namespace Brimvault::FolderWalk {

namespace {

QChar separatorOf(const QString& folder)
{
    if (folder.endsWith(u'\\'))
        return u'\\';
    if (folder.endsWith(u'/'))
        return u'/';
    return NativeSeparator();
}

QString withSeparator(const QString& folder)
{
    if (folder.endsWith(u'\\') || folder.endsWith(u'/'))
        return folder;
    return folder + NativeSeparator();
}

// A folder reached twice (a link back up the tree) is not walked again, and very deep trees end.
constexpr int MaximumDepth = 256;

struct WalkState {
    QList<WalkedFolder> result;
    QSet<QPair<quint64, quint64>> visited;
};

bool firstVisit(const Listing& listing, WalkState& state)
{
    if (!listing.identity)
        return true;
    if (state.visited.contains(*listing.identity))
        return false;
    state.visited.insert(*listing.identity);
    return true;
}

// The stop mark is looked for in the listing, so that folders without one cost no extra file look-up.
bool isStopFolder(const QString& folder, const Listing& listing)
{
    const QString mark = SideFiles::matchName(listing.files, CatalogueKeys::DirInfoFileName);
    return !mark.isEmpty() && InfoFiles::IsStopMark(folder + mark);
}

// ownIndex is the folder's place in the result, -1 for the root, which the caller keeps itself.
void collect(const QString& folder, qsizetype ownIndex, int depth, WalkState& state)
{
    if (depth > MaximumDepth)
        return;
    Listing listing = ListFolder(folder);
    if (!firstVisit(listing, state))
        return;
    const bool stop = isStopFolder(folder, listing);
    if (ownIndex >= 0)
        state.result[ownIndex].files = std::move(listing.files);
    if (stop)
        return;
    const QChar separator = separatorOf(folder);
    const qsizetype first = state.result.size();
    for (const QString& name : std::as_const(listing.folders))
        state.result.append({folder + name + separator, std::nullopt});
    const qsizetype end = state.result.size();
    for (qsizetype i = first; i < end; ++i) {
        const QString child = state.result.at(i).path;
        collect(child, i, depth + 1, state);
    }
}

} // namespace

Listing ListFolder(const QString& folder)
{
    Listing listing;
    if (folder.isEmpty())
        return listing;
#ifdef Q_OS_WIN
    QDirIterator it(folder, QDir::AllEntries | QDir::NoDotAndDotDot);
    while (it.hasNext()) {
        it.next();
        const QFileInfo info = it.fileInfo();
        (info.isDir() ? listing.folders : listing.files).append(info.fileName());
    }
#else
    const QByteArray base = QFile::encodeName(withSeparator(FileSystemPath(folder)));
    DIR* dir = ::opendir(base.constData());
    if (!dir)
        return listing;
    while (const dirent* entry = ::readdir(dir)) {
        // Dot entries are the hidden ones here, "." and ".." among them.
        if (entry->d_name[0] == '.')
            continue;
        bool isDir = entry->d_type == DT_DIR;
        bool isFile = entry->d_type == DT_REG;
        if (entry->d_type == DT_UNKNOWN || entry->d_type == DT_LNK) {
            struct stat status { };
            if (::stat(QByteArray(base + entry->d_name).constData(), &status) == 0) {
                isDir = S_ISDIR(status.st_mode);
                isFile = S_ISREG(status.st_mode);
            }
        }
        if (isDir)
            listing.folders.append(QFile::decodeName(entry->d_name));
        else if (isFile)
            listing.files.append(QFile::decodeName(entry->d_name));
    }
    struct stat status { };
    if (::fstat(::dirfd(dir), &status) == 0)
        listing.identity = qMakePair(quint64(status.st_dev), quint64(status.st_ino));
    ::closedir(dir);
#endif
    return listing;
}

QList<WalkedFolder> CollectSubfolders(const QString& folder)
{
    if (folder.isEmpty())
        return {};
    WalkState state;
    collect(withSeparator(folder), -1, 0, state);
    return state.result;
}

QStringList FilesOf(const WalkedFolder& folder)
{
    return folder.files ? *folder.files : ListFolder(folder.path).files;
}

} // namespace Brimvault::FolderWalk
