#pragma once

#include <QString>
#include <QtGlobal>

namespace Brimvault {

enum class RegistryRoot : quint32 {
    ClassesRoot = 0x80000000u,
    CurrentUser = 0x80000001u,
    LocalMachine = 0x80000002u,
};

// Creates or opens the key and writes the value as a 32-bit number. On Windows that is the registry;
// elsewhere BrowserEmulationFile(), one section per root and key path. False when it could not be written.
bool SaveDword(RegistryRoot root, const QString& keyPath, const QString& valueName, quint32 value);

// The stand-in for the registry elsewhere than on Windows: browser-emulation.ini in the settings folder.
QString BrowserEmulationFile();

// The two browser-emulation values for "Brimvault.exe" that the first web page of a host window writes.
void WriteBrowserEmulationValues();

} // namespace Brimvault
