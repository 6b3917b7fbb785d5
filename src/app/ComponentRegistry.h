#pragma once

#include <QString>
#include <QStringList>

namespace Brimvault {

// The per-user component registry: which library file serves each ProgID. Components write it from their
// DllRegisterServer; CreateObject reads it. One INI file in SettingsDirectory(); ProgIDs match without
// regard to letter case.
QString ComponentRegistryPath();

// Records every ProgID as served by the library at libraryPath (made absolute). False when the registry
// cannot be written; an unreadable registry is never overwritten.
bool RegisterProgIds(const QStringList& progIds, const QString& libraryPath);

// The library registered for the ProgID, or an empty text when there is none or the registry is unreadable.
QString RegisteredLibrary(const QString& progId);

} // namespace Brimvault
