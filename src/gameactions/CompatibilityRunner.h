#pragma once

#include <QString>

namespace Brimvault {

// The command line that starts Windows executables where they do not run natively: settings section
// "Settings", key "CompatibilityRunner". Empty when not set, which stands for "wine" on the PATH.
QString CompatibilityRunner();

} // namespace Brimvault
