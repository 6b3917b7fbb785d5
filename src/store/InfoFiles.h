#pragma once

#include <QString>

namespace Brimvault::InfoFiles {

// Small read-only record bag files that come with installed games and game folders.

// The game's info file: the path cut at its first "?", the extension of its file name replaced by
// ".bvxinf", in the same folder ("/" and "\" both separate folders; a bare name lies in ".\").
QString GameInfoFileName(const QString& gamePath);
// The same as its folder (with its separator) and its name, apart.
struct InfoFileParts {
    QString folder;
    QString name;
};
InfoFileParts GameInfoFileParts(const QString& gamePath);

// The display name from the game's info file: the record "Name_" + lngNik, else "Name", both trimmed;
// empty when there is no info file or neither record has a value.
QString GameInfoName(const QString& gamePath, const QString& lngNik);
// The same from a given info file.
QString ReadGameName(const QString& infoFile, const QString& lngNik);

// The stop mark file of a folder (folder with or without its trailing separator).
QString DirInfoFileName(const QString& folder);

// True when the folder's "DirInfo.bvxinf" says "StopDir" = "Yes" (exact case after trimming): the
// folder walk then skips the folder's files and everything below it.
bool IsStopFolder(const QString& folder);
// The same for a given stop mark file.
bool IsStopMark(const QString& infoFile);

} // namespace Brimvault::InfoFiles
