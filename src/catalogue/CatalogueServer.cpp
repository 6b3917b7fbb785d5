#include "catalogue/CatalogueServer.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

namespace Brimvault {

QString CatalogueRoot()
{
    QString root = qEnvironmentVariable("BRIMVAULT_CATALOGUE_ROOT").trimmed();
    if (root.isEmpty())
        root = GetSetting(AppTitle(), CatalogueKeys::SettingsSection, QStringLiteral("CatalogueRoot")).trimmed();
    if (root.isEmpty())
        root = QStringLiteral("http://www.brimvault.com");
    while (root.endsWith(u'/'))
        root.chop(1);
    return root;
}

QString OnlineCatalogueAddress()
{
    return CatalogueRoot() + QStringLiteral("/online-games-catalog.asp");
}

} // namespace Brimvault
