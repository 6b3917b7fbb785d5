#pragma once

namespace Brimvault {

// Call in main() before the QApplication is created: the web views of the media host need a shared
// OpenGL context, and the web engine refuses to start as root unless its sandbox is off.
void PrepareWebEngine();

} // namespace Brimvault
