#pragma once

#include <QString>

namespace Brimvault {

// Removes a game whose files lie directly in a folder (an installed game without a folder of its own): every
// plain file whose name begins like the game's file up to its first "." ("lines." for "lines.exe", so
// lines.bvxinf goes too but linesx.exe stays; a name without "." takes the name and the name followed by
// "."). Each file is first moved to its name + ".bak"; when one cannot be moved, those already moved are
// moved back and the result is false, so the game stays whole. Only then are the ".bak" files deleted.
bool RemoveLooseGameFiles(const QString& folder, const QString& gameFileName);

} // namespace Brimvault
