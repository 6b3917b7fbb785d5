#pragma once

#include "media/MediaHost.h"

namespace Brimvault {

// The media host's entry points, for the module to export and for a program that links the host in.
const MediaHost::EntryPoints* MediaHostEntryPoints();

} // namespace Brimvault
