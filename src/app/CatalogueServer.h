#pragma once

#include <QString>

namespace Brimvault {

// The catalogue web server's root address, without a trailing "/": BRIMVAULT_CATALOGUE_ROOT when set,
// else the setting "Settings"/"CatalogueRoot", else DefaultCatalogueRoot(). The connection check, the
// online catalogue and article pages, and Flash movies asking for their page address all start from it.
QString CatalogueServerRoot();
QString DefaultCatalogueRoot();

} // namespace Brimvault
