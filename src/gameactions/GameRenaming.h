#pragma once

#include <QString>
#include <optional>

namespace Brimvault {

// "Rename game": asks for the new caption ("Edit game name", the current caption as default answer) and
// stores it as the display name of the game's "Files" entry; a game without one (discovered, installed) is
// recorded as an added game first, under a new entry number. Web entries keep their captions. The new caption
// for the list, or nothing when nothing changed (web entry, Cancel, empty answer).
std::optional<QString> AskAndRenameGame(const QString& caption, const QString& data);

} // namespace Brimvault
