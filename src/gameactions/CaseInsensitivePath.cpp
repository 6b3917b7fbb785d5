#include "gameactions/CaseInsensitivePath.h"

#include <QDir>
#include <QFileInfo>

namespace Brimvault {

namespace {

QString entryIgnoringCase(const QDir& folder, const QString& name)
{
    if (QFileInfo::exists(folder.filePath(name)))
        return name;
    const QStringList entries
        = folder.entryList(QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot, QDir::Name);
    for (const QString& entry : entries) {
        if (entry.compare(name, Qt::CaseInsensitive) == 0)
            return entry;
    }
    return QString();
}

} // namespace

QString ExistingPathIgnoringCase(const QString& path)
{
#ifdef Q_OS_WIN
    return path;
#else
    if (path.isEmpty() || QFileInfo::exists(path))
        return path;
    const QString absolute = QDir::cleanPath(QDir::current().absoluteFilePath(path));
    QDir folder = QDir::root();
    QString found = QStringLiteral("/");
    const QStringList parts = absolute.split(u'/', Qt::SkipEmptyParts);
    for (qsizetype i = 0; i < parts.size(); ++i) {
        const QString entry = entryIgnoringCase(folder, parts.at(i));
        if (entry.isEmpty())
            return path;
        found = folder.filePath(entry);
        if (i + 1 < parts.size() && !folder.cd(entry))
            return path;
    }
    return found;
#endif
}

} // namespace Brimvault
