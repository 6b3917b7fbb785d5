#pragma once

#include <QString>

namespace Brimvault::GameNames {

// The display-name rules of the list that need no settings and no files.

// Cuts the installer's Russian "executable file for the game " prefix, shortens to 30 characters + "...",
// and inserts blanks after characters 12 and 25 of a name without any, so that the caption can wrap.
QString TidyName(const QString& name);

// The Zone games' and the publisher's own games' names by file title, translated; empty for other titles.
QString BuiltInName(const QString& fileTitle);

} // namespace Brimvault::GameNames
