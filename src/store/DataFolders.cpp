#include "store/DataFolders.h"

#include "store/CatalogueKeys.h"
#include "support/SystemFolders.h"

namespace Brimvault::DataFolders {

QString DataFolder(const QString& windowsSubPath)
{
    const QString root = SpecialFolderPath(CSIDL_COMMON_APPDATA);
    if (root.trimmed().isEmpty())
        return QString();
#ifdef Q_OS_WIN
    return root + windowsSubPath;
#else
    QString subPath = windowsSubPath;
    return root + subPath.replace(u'\\', u'/');
#endif
}

QString GamesFolder()
{
    return DataFolder(CatalogueKeys::GamesSubPath);
}

QString IconsFolder()
{
    return DataFolder(CatalogueKeys::IconsSubPath);
}

QString ReclamaFolder()
{
    return DataFolder(CatalogueKeys::ReclamaSubPath);
}

} // namespace Brimvault::DataFolders
