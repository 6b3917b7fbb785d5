#pragma once

#include <QLatin1String>

namespace Brimvault::ServiceCommands {

// Command lines of the companion service. The bare ".exe" name is found in the program's own folder first;
// elsewhere than on Windows it names our native executable without the extension.
inline constexpr QLatin1String AfterFirstLaunch("BrimvaultService.exe -R");
inline constexpr QLatin1String InstallPrefix("BrimvaultService.exe -I");

} // namespace Brimvault::ServiceCommands
