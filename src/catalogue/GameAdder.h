#pragma once

#include "catalogue/GameEntry.h"

#include <QList>
#include <QStringList>

#include <functional>
#include <optional>

namespace Brimvault {

class ListBuilder;

// Adds games the program did not find by itself: records each in the "Files" section and builds its list
// item. The dialogs are the window's; these take the chosen paths.
class GameAdder {
public:
    using EntrySink = std::function<void(const GameEntry&)>;

    explicit GameAdder(ListBuilder& builder);

    // One chosen file, executable or Flash movie; nothing when it is already listed.
    std::optional<GameEntry> AddGameFile(const QString& file);

    // Every game in the folder tree: the folders below it first (walk order), the folder itself last; only
    // ".exe" and ".swf", no excluded names, no installers by name or by version texts. "Count" is written
    // once, after the scan, even when nothing was added.
    QList<GameEntry> AddGamesFromFolder(const QString& folder, const EntrySink& sink = {});

    // Dropped files: executables only.
    QList<GameEntry> AddDroppedFiles(const QStringList& files, const EntrySink& sink = {});

    // Gives out the next entry number ("Count" first, then the path) and returns the new key.
    QString RecordAddedGame(const QString& path);

private:
    ListBuilder& m_builder;
};

} // namespace Brimvault
