#include "PackageExtractor.h"

#include "DiskSpace.h"
#include "PackageArchive.h"
#include "PackagePlan.h"

#include <QDir>
#include <QFile>
#include <QSet>

namespace Brimvault {

namespace {

QString quoted(const QString& text)
{
    return u'"' + text + u'"';
}

QString damaged(const QString& path, const QString& detail)
{
    return QStringLiteral("The package is damaged at %1 (%2).").arg(quoted(path), detail);
}

class Extraction {
public:
    Extraction(
        PackageArchive& archive, const QString& targetFolder, const ProgressCallback& progress, const PackagePlan& plan)
        : m_archive(archive)
        , m_target(targetFolder)
        , m_progress(progress)
        , m_total(plan.totalBytes)
        , m_needed(RequiredFreeSpace(plan.totalBytes, plan.fileCount))
    { }

    QString entry(const PlannedEntry& planned)
    {
        const QString destination = m_target + u'/' + planned.path;
        if (planned.folder)
            return makeFolder(planned.path) ? QString() : cannotWrite(planned.path, QStringLiteral("cannot create"));
        const qsizetype slash = planned.path.lastIndexOf(u'/');
        if (slash > 0 && !makeFolder(planned.path.left(slash)))
            return cannotWrite(planned.path, QStringLiteral("cannot create its folder"));
        return writeFile(planned, destination);
    }

private:
    bool makeFolder(const QString& relative)
    {
        if (m_folders.contains(relative))
            return true;
        if (!QDir(m_target).mkpath(relative))
            return false;
        m_folders.insert(relative);
        return true;
    }

    // Asked right after the failed call, while its error is still the thread's last one; a short write sets
    // no error, so the file system is asked too.
    QString cannotWrite(const QString& path, const QString& detail)
    {
        if (LastErrorWasDiskFull() || FileSystemFull(m_target))
            return NotEnoughSpaceProblem(m_needed, std::nullopt);
        return QStringLiteral("Could not write %1 (%2).").arg(quoted(path), detail);
    }

    QString writeFile(const PlannedEntry& planned, const QString& destination)
    {
        // NewOnly: the folder is ours and new, so anything already there is an error, never a target.
        QFile file(destination);
        if (!file.open(QIODevice::WriteOnly | QIODevice::NewOnly | QIODevice::Unbuffered))
            return cannotWrite(planned.path, file.errorString());
        qint64 written = 0;
        for (;;) {
            const void* block = nullptr;
            qint64 offset = 0;
            const qint64 size = m_archive.readBlock(&block, &offset);
            if (size == 0)
                break;
            if (size < 0)
                return damaged(planned.path, m_archive.errorText());
            if (offset != written)
                return damaged(planned.path, QStringLiteral("data out of order"));
            if (size > planned.size - written)
                return damaged(planned.path, QStringLiteral("larger than its header says"));
            if (file.write(static_cast<const char*>(block), size) != size)
                return cannotWrite(planned.path, file.errorString());
            written += size;
            m_done += size;
            if (m_progress && !m_progress(m_done, m_total))
                return QStringLiteral("The installation was cancelled.");
        }
        if (written != planned.size)
            return damaged(planned.path, QStringLiteral("shorter than its header says"));
        if (planned.modified.isValid())
            file.setFileTime(planned.modified, QFileDevice::FileModificationTime);
        file.close();
        if (file.error() != QFileDevice::NoError)
            return cannotWrite(planned.path, file.errorString());
        return QString();
    }

    PackageArchive& m_archive;
    QString m_target;
    const ProgressCallback& m_progress;
    qint64 m_total = 0;
    qint64 m_needed = 0;
    qint64 m_done = 0;
    QSet<QString> m_folders;
};

bool sameEntry(const EntryHeader& header, const PlannedEntry& planned)
{
    const bool folder = header.kind == EntryHeader::Kind::Folder;
    QString path = header.path;
    if (folder && path.endsWith(u'/'))
        path.chop(1);
    return header.pathReadable && folder == planned.folder && path == planned.path
        && (folder || (header.sizeKnown && header.size == planned.size));
}

} // namespace

QString ExtractPackage(
    PackageArchive& archive, const PackagePlan& plan, const QString& targetFolder, const ProgressCallback& progress)
{
    Extraction extraction(archive, targetFolder, progress, plan);
    EntryHeader header;
    for (const PlannedEntry& planned : plan.entries) {
        if (archive.nextHeader(header) != PackageArchive::Next::Entry)
            return damaged(planned.path, archive.errorText());
        if (!sameEntry(header, planned))
            return damaged(planned.path, QStringLiteral("headers disagree"));
        if (const QString problem = extraction.entry(planned); !problem.isEmpty())
            return problem;
    }
    if (archive.nextHeader(header) != PackageArchive::Next::End)
        return QStringLiteral("The package is damaged (more entries than at first reading).");
    return QString();
}

} // namespace Brimvault
