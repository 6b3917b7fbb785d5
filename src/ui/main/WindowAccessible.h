#pragma once

namespace Brimvault {

// Makes the program's own top-level windows (the main window, the media host window) windows to screen
// readers, named by their titles; a plain widget would be announced as an unnamed panel.
void InstallWindowAccessibility();

} // namespace Brimvault
