#include "PackageValidator.h"

#include "PackageArchive.h"

#include <QStringList>

namespace Brimvault {

namespace {

constexpr qsizetype MaxNameLength = 255;
constexpr qsizetype MaxPathLength = 1024;
// Below this the ratio says nothing: a few kilobytes of text compress very well and harm nobody.
constexpr qint64 RatioCheckThreshold = 1024 * 1024;

QString quoted(const QString& text)
{
    return u'"' + text + u'"';
}

bool isReservedDeviceName(const QString& component)
{
    const QString stem = component.section(u'.', 0, 0).trimmed().toUpper();
    static const QStringList devices = {QStringLiteral("CON"), QStringLiteral("PRN"), QStringLiteral("AUX"),
        QStringLiteral("NUL"), QStringLiteral("CLOCK$")};
    if (devices.contains(stem))
        return true;
    return stem.size() == 4 && (stem.startsWith(u"COM") || stem.startsWith(u"LPT")) && stem.at(3) >= u'1'
        && stem.at(3) <= u'9';
}

bool hasForbiddenCharacter(const QString& component)
{
    for (const QChar c : component) {
        if (c.unicode() < 0x20 || QStringView(u"<>:\"|?*").contains(c))
            return true;
    }
    return false;
}

QString componentProblem(const QString& component, const QString& path)
{
    if (component.isEmpty())
        return QStringLiteral("The package holds a name with an empty folder part: %1.").arg(quoted(path));
    if (component == u"." || component == u"..")
        return QStringLiteral("The package holds a name that points outside its folder: %1.").arg(quoted(path));
    if (component.size() > MaxNameLength)
        return QStringLiteral("The package holds a name that is too long: %1.").arg(quoted(path));
    if (hasForbiddenCharacter(component) || component.endsWith(u'.') || component.endsWith(u' ')
        || isReservedDeviceName(component))
        return QStringLiteral("The package holds a name that is not allowed in file names: %1.").arg(quoted(path));
    return QString();
}

// Folders the program keeps inside the games folder for itself.
bool isReservedGameFolderName(const QString& name)
{
    return name.startsWith(u'.') || name.compare(u"Icons", Qt::CaseInsensitive) == 0
        || name.compare(u"Reclama", Qt::CaseInsensitive) == 0;
}

QString entryKindProblem(const EntryHeader& header)
{
    switch (header.kind) {
    case EntryHeader::Kind::SymbolicLink:
        return QStringLiteral("The package holds a symbolic link: %1.").arg(quoted(header.path));
    case EntryHeader::Kind::HardLink:
        return QStringLiteral("The package holds a hard link: %1.").arg(quoted(header.path));
    case EntryHeader::Kind::Special:
        return QStringLiteral("The package holds a device or other special file: %1.").arg(quoted(header.path));
    case EntryHeader::Kind::File:
    case EntryHeader::Kind::Folder:
        break;
    }
    if (header.encrypted)
        return QStringLiteral("The package holds an encrypted entry: %1.").arg(quoted(header.path));
    if (!header.sizeKnown || header.size < 0)
        return QStringLiteral("The package holds an entry without a valid size: %1.").arg(quoted(header.path));
    return QString();
}

QString megabytes(qint64 bytes)
{
    return QString::number((bytes + 1024 * 1024 - 1) / (1024 * 1024));
}

} // namespace

PackageValidator::PackageValidator(const PackageLimits& limits, qint64 packageBytes)
    : m_limits(limits)
    , m_packageBytes(packageBytes)
{ }

bool PackageValidator::isGameFileName(const QString& name)
{
    return name.endsWith(u".exe", Qt::CaseInsensitive) || name.endsWith(u".swf", Qt::CaseInsensitive);
}

QString PackageValidator::pathProblem(const QString& path)
{
    if (path.isEmpty())
        return QStringLiteral("The package holds an entry without a name.");
    if (path.size() > MaxPathLength)
        return QStringLiteral("The package holds a name that is too long: %1.").arg(quoted(path.left(80) + u"..."));
    if (path.contains(u'\\'))
        return QStringLiteral("The package holds a name with a backslash: %1.").arg(quoted(path));
    if (path.startsWith(u'/'))
        return QStringLiteral("The package holds an absolute path: %1.").arg(quoted(path));
    if (path.size() >= 2 && path.at(1) == u':' && path.at(0).isLetter())
        return QStringLiteral("The package holds a path with a drive letter: %1.").arg(quoted(path));
    const QStringList components = path.split(u'/');
    for (const QString& component : components) {
        const QString problem = componentProblem(component, path);
        if (!problem.isEmpty())
            return problem;
    }
    return QString();
}

QString PackageValidator::addEntry(const EntryHeader& header)
{
    if (!header.pathReadable)
        return QStringLiteral("The package holds an entry whose name cannot be read.");
    if (m_plan.entries.size() >= m_limits.maxEntries)
        return QStringLiteral("The package holds more than %1 entries.").arg(m_limits.maxEntries);
    if (const QString problem = entryKindProblem(header); !problem.isEmpty())
        return problem;

    const bool folder = header.kind == EntryHeader::Kind::Folder;
    QString path = header.path;
    if (folder && path.endsWith(u'/'))
        path.chop(1);
    if (const QString problem = pathProblem(path); !problem.isEmpty())
        return problem;

    const qsizetype slash = path.indexOf(u'/');
    if (!folder && slash < 0)
        return QStringLiteral("The package holds a file outside the game's folder: %1.").arg(quoted(path));
    const QString top = path.left(slash);
    if (m_plan.gameFolder.isEmpty()) {
        if (isReservedGameFolderName(top))
            return QStringLiteral("The package's folder name is reserved: %1.").arg(quoted(top));
        m_plan.gameFolder = top;
    } else if (top != m_plan.gameFolder) {
        return QStringLiteral("The package holds more than one top-level folder (%1 and %2).")
            .arg(quoted(m_plan.gameFolder), quoted(top));
    }
    if (header.size > m_limits.maxUnpackedBytes - m_plan.totalBytes)
        return QStringLiteral("The package unpacks to more than the limit of %1 MB.")
            .arg(megabytes(m_limits.maxUnpackedBytes));
    if (const QString problem = registerPath(path, folder); !problem.isEmpty())
        return problem;

    if (!folder) {
        m_plan.totalBytes += header.size;
        ++m_plan.fileCount;
        if (path.count(u'/') == 1 && isGameFileName(path))
            m_hasGameFile = true;
    }
    m_plan.entries.append({path, folder, folder ? 0 : header.size, header.modified});
    return QString();
}

// Names are compared case-folded: on Windows and on most game media "Data" and "data" are one folder, and
// letting one entry silently overwrite or merge into another would make the result depend on the system.
QString PackageValidator::registerPath(const QString& path, bool folder)
{
    const QString folded = path.toCaseFolded();
    if (m_foldedFiles.contains(folded))
        return QStringLiteral("The package holds %1 twice.").arg(quoted(path));
    if (!folder && m_foldedFolders.contains(folded))
        return QStringLiteral("The package holds %1 both as a file and as a folder.").arg(quoted(path));

    for (qsizetype slash = folded.indexOf(u'/'); slash >= 0; slash = folded.indexOf(u'/', slash + 1)) {
        const QString parent = folded.left(slash);
        if (m_foldedFiles.contains(parent))
            return QStringLiteral("The package holds %1 both as a file and as a folder.").arg(quoted(path.left(slash)));
        m_foldedFolders.insert(parent);
    }
    if (folder)
        m_foldedFolders.insert(folded);
    else
        m_foldedFiles.insert(folded);
    return QString();
}

QString PackageValidator::finish()
{
    if (m_plan.entries.isEmpty())
        return QStringLiteral("The package is empty.");
    if (!m_hasGameFile)
        return QStringLiteral("The package holds no game: its folder %1 has no .exe or .swf file.")
            .arg(quoted(m_plan.gameFolder));
    if (m_plan.totalBytes > RatioCheckThreshold) {
        const qint64 ratio = m_plan.totalBytes / qMax<qint64>(m_packageBytes, 1);
        if (ratio > m_limits.maxRatio)
            return QStringLiteral("The package is compressed %1 to 1, beyond the limit of %2 to 1.")
                .arg(ratio)
                .arg(m_limits.maxRatio);
    }
    return QString();
}

QString ValidatePackage(PackageArchive& archive, const PackageLimits& limits, qint64 packageBytes, PackagePlan& plan)
{
    PackageValidator validator(limits, packageBytes);
    EntryHeader header;
    for (;;) {
        const PackageArchive::Next next = archive.nextHeader(header);
        if (next == PackageArchive::Next::End)
            break;
        if (next == PackageArchive::Next::Error)
            return QStringLiteral("The package is damaged or is not a game package (%1).").arg(archive.errorText());
        if (const QString problem = validator.addEntry(header); !problem.isEmpty())
            return problem;
    }
    if (const QString problem = validator.finish(); !problem.isEmpty())
        return problem;
    plan = validator.plan();
    return QString();
}

} // namespace Brimvault
