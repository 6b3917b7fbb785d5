#pragma once

#include <QString>

// Writes a hand-made game package of the given kind ("absolute", "symlink", "corrupt", "fifo", ...: the kinds
// of tests/service/craft_package.py) to out. Needs python3.
bool CraftPackage(const QString& kind, const QString& out);
