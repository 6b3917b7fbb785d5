#pragma once

#include <QString>

namespace Brimvault {

// The catalogue web server's root address, without a trailing "/": BRIMVAULT_CATALOGUE_ROOT, else the
// "Settings"/"CatalogueRoot" setting, else the publisher's server.
QString CatalogueRoot();

// The online games catalogue page, the data string of the list's online games entry.
QString OnlineCatalogueAddress();

} // namespace Brimvault
