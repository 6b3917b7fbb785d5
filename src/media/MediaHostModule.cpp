// The module the program loads for its media host window (see media/MediaHost.h).
#include "media/MediaHostEntry.h"

#include <QtGlobal>

extern "C" Q_DECL_EXPORT const Brimvault::MediaHost::EntryPoints* BrimvaultMediaHost1()
{
    return Brimvault::MediaHostEntryPoints();
}
