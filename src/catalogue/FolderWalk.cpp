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
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
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

// A folder's listing, and on Linux the folder still open until this goes, so that the walk opens the
// folders below it by name: the system then walks one path part instead of the whole path.
struct OpenedListing {
    Listing listing;
    int descriptor = -1;

    explicit OpenedListing(const QString& folder, const OpenedListing* parent = nullptr, const QString& name = {});
    ~OpenedListing();
    OpenedListing(const OpenedListing&) = delete;
    OpenedListing& operator=(const OpenedListing&) = delete;
};

OpenedListing::OpenedListing(const QString& folder, const OpenedListing* parent, const QString& name)
{
    if (folder.isEmpty())
        return;
#ifdef Q_OS_WIN
    Q_UNUSED(parent)
    Q_UNUSED(name)
    QDirIterator it(folder, QDir::AllEntries | QDir::NoDotAndDotDot);
    while (it.hasNext()) {
        it.next();
        const QFileInfo info = it.fileInfo();
        (info.isDir() ? listing.folders : listing.files).append(info.fileName());
    }
#else
    // A name with a backslash is opened by the whole path, where backslashes separate as they do elsewhere.
    const bool byName = parent && parent->descriptor >= 0 && !name.isEmpty() && !name.contains(u'\\');
    descriptor = byName ? ::openat(parent->descriptor, name.toUtf8().constData(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)
                        : ::open(QFile::encodeName(withSeparator(FileSystemPath(folder))).constData(),
                            O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0)
        return;
    struct stat status { };
    if (::fstat(descriptor, &status) == 0)
        listing.identity = qMakePair(quint64(status.st_dev), quint64(status.st_ino));
    const auto take = [&](const char* entryName, unsigned char type) {
        // Dot entries are the hidden ones here, "." and ".." among them.
        if (entryName[0] == '.')
            return;
        bool isDir = type == DT_DIR;
        bool isFile = type == DT_REG;
        if (type == DT_UNKNOWN || type == DT_LNK) {
            struct stat entryStatus { };
            if (::fstatat(descriptor, entryName, &entryStatus, 0) == 0) {
                isDir = S_ISDIR(entryStatus.st_mode);
                isFile = S_ISREG(entryStatus.st_mode);
            }
        }
        // File names are UTF-8 here; the plain decoder is many times quicker than the locale's on a short name.
        if (isDir)
            listing.folders.append(QString::fromUtf8(entryName, qstrlen(entryName)));
        else if (isFile)
            listing.files.append(QString::fromUtf8(entryName, qstrlen(entryName)));
    };
#ifdef Q_OS_LINUX
    // The entries are read straight into a buffer of our own: a walk lists every folder of a large library,
    // and a directory stream would cost a further system call and a large allocation for each.
    alignas(dirent64) char buffer[32 * 1024];
    ssize_t got = 0;
    while ((got = ::getdents64(descriptor, buffer, sizeof buffer)) > 0) {
        for (ssize_t at = 0; at < got;) {
            const auto* entry = reinterpret_cast<const dirent64*>(buffer + at);
            take(entry->d_name, entry->d_type);
            at += entry->d_reclen;
        }
    }
#else
    // The stream reads through its own duplicate, so that this descriptor stays open for the folders below.
    if (DIR* dir = ::fdopendir(::dup(descriptor))) {
        while (const dirent* entry = ::readdir(dir))
            take(entry->d_name, entry->d_type);
        ::closedir(dir);
    }
#endif
#endif
}

OpenedListing::~OpenedListing()
{
#ifndef Q_OS_WIN
    if (descriptor >= 0)
        ::close(descriptor);
#endif
}

// A folder reached twice (a link back up the tree) is not walked again, and very deep trees end.
constexpr int MaximumDepth = 256;

struct WalkState {
    QList<WalkedFolder> result;
    QList<bool> settled; // the folder's place and files are final
    qsizetype handed = 0;
    const FolderSink* found = nullptr;
    std::optional<QString> handedRoot; // the root as the caller wrote it, when it is handed on too
    bool stopped = false;
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

// Hands on the folders whose places and files are final, in walk order, and lets go of their listings.
void handSettled(WalkState& state)
{
    while (!state.stopped && state.handed < state.result.size() && state.settled.at(state.handed)) {
        WalkedFolder& folder = state.result[state.handed++];
        state.stopped = !(*state.found)(folder);
        folder.files.reset();
    }
}

void settle(qsizetype ownIndex, WalkState& state)
{
    if (ownIndex < 0)
        return;
    state.settled[ownIndex] = true;
    handSettled(state);
}

// ownIndex is the folder's place in the result, -1 for the root, which the caller keeps itself; `parent` is
// the folder above, still open, and `name` the folder's name in it.
void collect(const QString& folder, qsizetype ownIndex, int depth, WalkState& state,
    const OpenedListing* parent = nullptr, const QString& name = {})
{
    if (state.stopped)
        return;
    // A folder too deep, or reached twice, keeps its place without a listing; it is listed when read.
    if (depth > MaximumDepth)
        return settle(ownIndex, state);
    OpenedListing opened(folder, parent, name);
    Listing& listing = opened.listing;
    if (!firstVisit(listing, state))
        return settle(ownIndex, state);
    const bool stop = isStopFolder(folder, listing);
    if (ownIndex < 0 && state.handedRoot) {
        state.stopped = !(*state.found)({*state.handedRoot, listing.files});
        if (state.stopped)
            return;
    }
    const QChar separator = separatorOf(folder);
    const qsizetype first = state.result.size();
    if (!stop) {
        for (const QString& subfolder : std::as_const(listing.folders)) {
            state.result.append({folder + subfolder + separator, std::nullopt});
            state.settled.append(false);
        }
    }
    const qsizetype end = state.result.size();
    if (ownIndex >= 0)
        state.result[ownIndex].files = std::move(listing.files);
    settle(ownIndex, state);
    for (qsizetype i = first; i < end && !state.stopped; ++i) {
        const QString child = state.result.at(i).path;
        collect(child, i, depth + 1, state, &opened, listing.folders.at(i - first));
    }
}

} // namespace

Listing ListFolder(const QString& folder)
{
    return OpenedListing(folder).listing;
}

namespace {

bool walk(const QString& folder, const FolderSink& found, bool handRoot)
{
    if (folder.isEmpty())
        return true;
    WalkState state;
    state.found = &found;
    if (handRoot)
        state.handedRoot = folder;
    collect(withSeparator(folder), -1, 0, state);
    return !state.stopped;
}

} // namespace

bool WalkSubfolders(const QString& folder, const FolderSink& found)
{
    return walk(folder, found, false);
}

bool WalkFolderTree(const QString& folder, const FolderSink& found)
{
    return walk(folder, found, true);
}

QList<WalkedFolder> CollectSubfolders(const QString& folder)
{
    QList<WalkedFolder> folders;
    WalkSubfolders(folder, [&folders](const WalkedFolder& found) {
        folders.append(found);
        return true;
    });
    return folders;
}

QStringList FilesOf(const WalkedFolder& folder)
{
    return folder.files ? *folder.files : ListFolder(folder.path).files;
}

} // namespace Brimvault::FolderWalk
