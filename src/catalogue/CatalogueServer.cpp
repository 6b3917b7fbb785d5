#include "catalogue/CatalogueServer.h"

#include "app/CatalogueServer.h"

namespace Brimvault {

QString OnlineCatalogueAddress()
{
    return CatalogueServerRoot() + QStringLiteral("/online-games-catalog.asp");
}

} // namespace Brimvault
