#pragma once

#include <QString>

#include <cstdint>
#include <stdexcept>

// The program's entry: makes the five companion components usable, initialises localisation and shows the
// main window.
namespace Brimvault::modMain {

// A component file, or its DllRegisterServer, that cannot be found.
class ComponentFileError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// Checks the components in order and stops at the first that cannot be made usable; otherwise shows
// frmMain modeless. Returns at once; the caller runs the event loop while a window is open.
void Main();

// Makes one component usable, registering it when its version object cannot be created, and keeps its
// version text in the settings. False (after the administrator message) when that fails.
bool CheckComponent(const QString& prefix);

// Loads the prefix's file by bare name (the program's folder first) and returns its DllRegisterServer
// status. An unknown prefix does nothing and gives 0. Throws ComponentFileError when the file or the
// entry point is missing.
std::int32_t RegisterComponent(const QString& prefix);

// "You need to run the program as administrator!", untranslated: localisation is not up yet.
void ShowAdminMessage();

} // namespace Brimvault::modMain
