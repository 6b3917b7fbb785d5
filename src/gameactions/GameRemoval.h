#pragma once

#include <QString>

namespace Brimvault {

enum class RemovalOutcome {
    Cancelled, // the user said No
    Failed, // "There was an error! The game isn't removed!" was shown; the entry stays
    Removed, // the window removes the current item and forgets its path
};

// "Remove game...": asks "Remove <caption>?"; an installed game (its path below the games folder) loses its
// files: its own folder is deleted with DeleteFolderTree, files lying directly in the games folder go with
// RemoveLooseGameFiles. Installed or added, every "Files" entry with the same path is then forgotten with its
// display name; the entry numbers are not given out again.
RemovalOutcome AskAndRemoveGame(const QString& caption, const QString& data);

// "Remove all added games...": asks, then deletes the whole "Files" section (display names stay). True when
// the list must be rebuilt; false after No, or when there was no section to delete.
bool AskAndRemoveAllAddedGames();

} // namespace Brimvault
