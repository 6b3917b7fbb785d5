#include "PackageWriter.h"

#include "PackageValidator.h"

#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QFileInfo>
#include <QSaveFile>

#include <archive.h>
#include <archive_entry.h>

#include <memory>

namespace Brimvault {

namespace {

constexpr qint64 CopyBlockSize = 1024 * 1024;

QString quoted(const QString& text)
{
    return u'"' + text + u'"';
}

struct ArchiveDeleter {
    void operator()(archive* a) const { archive_write_free(a); }
};
struct EntryDeleter {
    void operator()(archive_entry* e) const { archive_entry_free(e); }
};

// Relative paths of everything below the folder, sorted so that the same folder always gives the same package.
QString collectEntries(const QString& root, QStringList& relativePaths)
{
    const QDir rootDir(root);
    QDirIterator it(
        root, QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QFileInfo info(it.next());
        const QString relative = rootDir.relativeFilePath(info.filePath());
        if (info.isSymLink() || (!info.isFile() && !info.isDir()))
            return QStringLiteral("%1 is a link or special file; packages hold plain files and folders only.")
                .arg(quoted(relative));
        relativePaths.append(relative);
    }
    relativePaths.sort();
    return QString();
}

QString writeEntry(archive* out, const QFileInfo& info, const QString& name, QByteArray& buffer)
{
    std::unique_ptr<archive_entry, EntryDeleter> entry(archive_entry_new());
    archive_entry_set_pathname_utf8(entry.get(), (info.isDir() ? name + u'/' : name).toUtf8().constData());
    archive_entry_set_filetype(entry.get(), info.isDir() ? AE_IFDIR : AE_IFREG);
    archive_entry_set_perm(entry.get(), info.isDir() ? 0755 : 0644);
    archive_entry_set_size(entry.get(), info.isDir() ? 0 : info.size());
    archive_entry_set_mtime(entry.get(), info.lastModified().toSecsSinceEpoch(), 0);
    if (archive_write_header(out, entry.get()) != ARCHIVE_OK)
        return QString::fromLocal8Bit(archive_error_string(out));
    if (info.isDir())
        return QString();

    QFile file(info.filePath());
    if (!file.open(QIODevice::ReadOnly))
        return QStringLiteral("%1 cannot be read (%2).").arg(quoted(name), file.errorString());
    qint64 remaining = info.size();
    while (remaining > 0) {
        const qint64 got = file.read(buffer.data(), qMin(remaining, CopyBlockSize));
        if (got <= 0)
            return QStringLiteral("%1 changed or cannot be read.").arg(quoted(name));
        if (archive_write_data(out, buffer.constData(), size_t(got)) != got)
            return QString::fromLocal8Bit(archive_error_string(out));
        remaining -= got;
    }
    return QString();
}

} // namespace

QString PackGameFolder(const QString& gameFolder, const QString& packagePath)
{
    const QFileInfo folderInfo(gameFolder);
    if (!folderInfo.isDir())
        return QStringLiteral("The game folder %1 does not exist.").arg(quoted(gameFolder));
    const QString root = folderInfo.canonicalFilePath();
    const QString name = QDir(root).dirName();
    if (const QString problem = PackageValidator::pathProblem(name); !problem.isEmpty() || name.startsWith(u'.'))
        return QStringLiteral("The folder name %1 cannot be a game's folder name.").arg(quoted(name));

    const QFileInfo packageInfo(packagePath);
    const QString packageFolder = QFileInfo(packageInfo.absolutePath()).canonicalFilePath();
    if (packageFolder == root || packageFolder.startsWith(root + u'/'))
        return QStringLiteral("The package cannot be written inside the game folder it packs.");

    QStringList relativePaths;
    if (const QString problem = collectEntries(root, relativePaths); !problem.isEmpty())
        return problem;
    const bool hasGameFile = std::any_of(relativePaths.cbegin(), relativePaths.cend(), [&](const QString& path) {
        return !path.contains(u'/') && PackageValidator::isGameFileName(path) && QFileInfo(root + u'/' + path).isFile();
    });
    if (!hasGameFile)
        return QStringLiteral("The folder %1 holds no game: it has no .exe or .swf file.").arg(quoted(gameFolder));

    QSaveFile target(packagePath);
    if (!target.open(QIODevice::WriteOnly))
        return QStringLiteral("%1 cannot be written (%2).").arg(quoted(packagePath), target.errorString());
    std::unique_ptr<archive, ArchiveDeleter> out(archive_write_new());
    archive_write_set_format_zip(out.get());
    archive_write_set_bytes_in_last_block(out.get(), 1);
    if (archive_write_open_fd(out.get(), target.handle()) != ARCHIVE_OK)
        return QString::fromLocal8Bit(archive_error_string(out.get()));

    QByteArray buffer(CopyBlockSize, Qt::Uninitialized);
    QString problem = writeEntry(out.get(), folderInfo, name, buffer);
    for (const QString& relative : std::as_const(relativePaths)) {
        if (!problem.isEmpty())
            break;
        problem = writeEntry(out.get(), QFileInfo(root + u'/' + relative), name + u'/' + relative, buffer);
    }
    if (problem.isEmpty() && archive_write_close(out.get()) != ARCHIVE_OK)
        problem = QString::fromLocal8Bit(archive_error_string(out.get()));
    out.reset();
    if (!problem.isEmpty()) {
        target.cancelWriting();
        return problem;
    }
    if (!target.commit())
        return QStringLiteral("%1 cannot be written (%2).").arg(quoted(packagePath), target.errorString());
    return QString();
}

} // namespace Brimvault
