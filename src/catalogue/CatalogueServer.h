#pragma once

#include <QString>

namespace Brimvault {

// The online games catalogue page, the data string of the list's online games entry.
QString OnlineCatalogueAddress();

} // namespace Brimvault
