#include "app/CatalogueServer.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

namespace Brimvault {

namespace {

QString withoutTrailingSlash(QString root)
{
    root = root.trimmed();
    while (root.endsWith(u'/'))
        root.chop(1);
    return root;
}

} // namespace

QString DefaultCatalogueRoot()
{
    return QStringLiteral("http://www.brimvault.com");
}

QString CatalogueServerRoot()
{
    const QString fromEnvironment = withoutTrailingSlash(qEnvironmentVariable("BRIMVAULT_CATALOGUE_ROOT"));
    if (!fromEnvironment.isEmpty())
        return fromEnvironment;
    const QString fromSettings = withoutTrailingSlash(
        GetSetting(AppTitle(), QString(CatalogueKeys::SettingsSection), QStringLiteral("CatalogueRoot")));
    if (!fromSettings.isEmpty())
        return fromSettings;
    return DefaultCatalogueRoot();
}

} // namespace Brimvault
