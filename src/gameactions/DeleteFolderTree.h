#pragma once

#include <QString>

namespace Brimvault {

// Deletes a folder with everything in it, hidden and read-only files included; one trailing separator is
// dropped first. A sub-folder that cannot be deleted ends the whole operation with false at once. Symbolic
// links are removed as links: what they point to is never touched. True when the folder is gone.
bool DeleteFolderTree(const QString& folder);

} // namespace Brimvault
