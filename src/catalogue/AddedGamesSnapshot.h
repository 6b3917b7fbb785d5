#pragma once

#include "store/CatalogueStore.h"

#include <QHash>
#include <QList>
#include <QString>

namespace Brimvault {

// The "Files" and "FilesNames" sections as read once at the start of a pass, so that a large library costs
// two reads of the store instead of one per game.
class AddedGamesSnapshot {
public:
    void read();

    // Every "File" entry in the store's order, without the counter.
    const QList<CatalogueStore::AddedGame>& games() const { return m_games; }

    // The user's own name for the game: the "FileName" + n of the first entry whose path matches,
    // ignoring letter case and surrounding blanks; empty when there is none.
    QString userName(const QString& path) const;
    // The same for a path already trimmed and lower-cased, as the list keeps its known paths.
    QString userNameOfKnownPath(const QString& knownPath) const;

    // The highest entry number given out: "Count", or a higher number still in use.
    int highestNumber() const;

    // Keeps the snapshot in step with an entry just written to the store.
    void noteAddedGame(const QString& key, const QString& path);

private:
    QList<CatalogueStore::AddedGame> m_games;
    QHash<QString, QString> m_keyByPath; // normalised path -> "File" key
    QHash<QString, QString> m_nameByKey; // lower-cased "FileName" key -> name
    int m_count = 0;
};

} // namespace Brimvault
