#pragma once

#include "catalogue/AddedGamesSnapshot.h"
#include "catalogue/GameEntry.h"
#include "catalogue/SideFiles.h"

#include <QSet>
#include <QString>

#include <memory>

namespace Brimvault {

class OpenFolder;

// Turns the path of one game into one list item: its caption and its picture, or the decision to queue it
// for the icon cache builder. Keeps the known paths of the list for the duplicate tests.
class ListBuilder {
public:
    explicit ListBuilder(const QString& iconsFolder);
    ~ListBuilder();

    // A new list: reads the added games, their user names and the language tag once, forgets the known paths.
    void beginPass();
    // Forgets the folder listings of the pass, so that files added later are seen.
    void endPass();

    GameEntry OnlineGamesEntry() const;
    // The item for the game; its lower-cased, trimmed path becomes a known path.
    GameEntry AddGameToList(const QString& path);
    bool IsGameListed(const QString& path) const;
    // A game removed from the list: its path is no longer known, and the added games are read again.
    void ForgetGame(const QString& path);

    // The name before tidying: the user's name, the info file, the built-in tables, the version
    // description, the file title; first non-empty wins.
    QString RawDisplayName(const QString& path) const;

    // The picture the list shows for an icon file (an entry's iconFile, for an entry whose picture was left
    // for later); null when the file holds none.
    static QImage ShownPicture(const QString& iconFile);

    // The command line lists without pictures: it needs only the decision, not the images.
    void setKeepPictures(bool keep) { m_keepPictures = keep; }

    AddedGamesSnapshot& addedGames() { return m_addedGames; }
    SideFiles& sideFiles() { return m_sideFiles; }
    const QString& iconsFolder() const { return m_iconsFolder; }

private:
    QString rawDisplayName(const QString& path, const QString& knownPath) const;
    void chooseIcon(GameEntry& entry) const;

    QString m_iconsFolder;
    QString m_languageTag;
    AddedGamesSnapshot m_addedGames;
    QSet<QString> m_knownPaths;
    mutable SideFiles m_sideFiles;
    // The cached icons' folder, held open for the pass: thousands of icons are opened in it by name.
    std::unique_ptr<OpenFolder> m_openIconsFolder;
    bool m_keepPictures = true;
};

} // namespace Brimvault
