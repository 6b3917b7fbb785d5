#include "catalogue/SideFiles.h"

#include "catalogue/FolderWalk.h"
#include "store/CatalogueKeys.h"

namespace Brimvault {

namespace {

bool isSideFile(const QString& name)
{
    return name.endsWith(CatalogueKeys::InfoFileExtension, Qt::CaseInsensitive)
        || name.endsWith(QLatin1String(".ico"), Qt::CaseInsensitive);
}

} // namespace

QStringList SideFiles::sideFilesAmong(const QStringList& files)
{
    QStringList names;
    for (const QString& file : files) {
        if (isSideFile(file))
            names.append(file);
    }
    return names;
}

void SideFiles::remember(const QString& folder, const QStringList& files)
{
    m_walked = {folder, sideFilesAmong(files)};
}

QString SideFiles::find(const QString& folder, const QString& name)
{
    const QStringList* names = &m_walked.names;
    if (folder != m_walked.path) {
        auto known = m_folders.constFind(folder);
        if (known == m_folders.constEnd())
            known = m_folders.insert(folder, sideFilesAmong(FolderWalk::ListFolder(folder).files));
        names = &*known;
    }
    const QString match = matchName(*names, name);
    return match.isEmpty() ? QString() : folder + match;
}

QString SideFiles::matchName(const QStringList& files, const QString& name)
{
    QString match;
    for (const QString& file : files) {
        // Letter case never changes a name's length; the length test spares most comparisons.
        if (file.size() != name.size() || file.compare(name, Qt::CaseInsensitive) != 0)
            continue;
        if (file == name)
            return file;
        if (match.isEmpty())
            match = file;
    }
    return match;
}

} // namespace Brimvault
