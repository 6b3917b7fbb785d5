#pragma once

#include <QHash>
#include <QList>
#include <QString>
#include <optional>

namespace Brimvault::CatalogueStore {

// The games the user added by hand: settings section "Files", one "File" + n value per game, n given out
// from "Count" and never reused, so the section may have gaps.

struct AddedGame {
    QString key; // as stored, e.g. "File3"
    QString path;
    // The n of "File" + n; 0 for a key that does not have that form.
    int number() const;
};

// Every entry of the section in the store's order, without the counter.
QList<AddedGame> AddedGames();

// Gives out the next entry number ("Count" + 1, written back first), stores the path under it and returns
// its key. A counter below a number still in use (edited by hand, lost) is passed over, never reused.
QString AddGame(const QString& path);

// The entry whose path matches, ignoring letter case and surrounding blanks.
std::optional<AddedGame> FindAddedGame(const QString& path);
std::optional<AddedGame> FindAddedGame(const QList<AddedGame>& games, const QString& path);

// Lookups for many paths at once (list building): the first entry for each path, keyed by NormalisedPath.
QHash<QString, AddedGame> IndexByPath(const QList<AddedGame>& games);
// Trimmed and in lower case, the form in which paths are compared.
QString NormalisedPath(const QString& path);

// Deletes the entry and the user's display name for it; the counter stays.
void RemoveGame(const QString& fileKey);
// Deletes the whole "Files" section; display names stay.
void RemoveAllAddedGames();

// "File3" -> "FileName3", the key of the display name in "FilesNames".
QString DisplayNameKey(const QString& fileKey);
QString DisplayName(const QString& fileKey);
void SetDisplayName(const QString& fileKey, const QString& name);

// The highest entry number given out so far.
int EntryCount();

// The number to give out after `highest`: the next one up, or, once the largest number there is has been
// given out (a counter edited by hand), the smallest one that none of `games` uses.
int NextEntryNumber(int highest, const QList<AddedGame>& games);

bool SamePath(const QString& a, const QString& b);

} // namespace Brimvault::CatalogueStore
