#include "gameactions/CompatibilityRunner.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

namespace Brimvault {

QString CompatibilityRunner()
{
    return GetSetting(AppTitle(), CatalogueKeys::SettingsSection, QStringLiteral("CompatibilityRunner")).trimmed();
}

} // namespace Brimvault
