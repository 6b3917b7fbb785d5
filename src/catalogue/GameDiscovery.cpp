#include "catalogue/GameDiscovery.h"

#include "catalogue/FolderWalk.h"
#include "catalogue/GameEntry.h"
#include "catalogue/GameFileRules.h"
#include "catalogue/ListBuilder.h"
#include "catalogue/ListedPaths.h"
#include "catalogue/WindowsGames.h"
#include "support/PathFunctions.h"
#include "support/TextCase.h"

#include <QScopeGuard>

namespace Brimvault {

namespace {

bool stopped(const std::function<bool()>& stopRequested)
{
    return stopRequested && stopRequested();
}

} // namespace

GameDiscovery::GameDiscovery(ListBuilder& builder, CatalogueLocations locations)
    : m_builder(builder)
    , m_locations(std::move(locations))
{ }

bool GameDiscovery::ForEachInstalledGameFile(const FileSink& found, const DiscoveryHooks& hooks) const
{
    // Folders are compared with these ignoring case: folded once here and once per folder, which costs far
    // less than a case-insensitive comparison on every folder of a large library.
    const QString gamesFolder = CaseFolded(m_locations.gamesFolder);
    const QString advertisingFolder
        = gamesFolder.isEmpty() ? QString() : gamesFolder + QStringLiteral("reclama") + gamesFolder.back();
    const auto handFiles = [&](const FolderWalk::WalkedFolder& folder) {
        if (hooks.letEventsRun)
            hooks.letEventsRun();
        if (stopped(hooks.stopRequested))
            return false;
        const QStringList names = FolderWalk::FilesOf(folder);
        // The list builder looks for the games' info files and icons in this same listing.
        m_builder.sideFiles().remember(folder.path, names);
        for (const QString& name : names) {
            if (!GameFileRules::IsDiscoverableExecutable(name))
                continue;
            if (stopped(hooks.stopRequested) || !found(folder.path + name))
                return false;
        }
        const QString foldedPath = CaseFolded(folder.path);
        const bool inGamesFolder
            = !gamesFolder.isEmpty() && foldedPath.startsWith(gamesFolder) && !foldedPath.startsWith(advertisingFolder);
        if (!inGamesFolder)
            return true;
        for (const QString& name : names) {
            if (!GameFileRules::HasExtension(name, QLatin1String("swf")))
                continue;
            if (stopped(hooks.stopRequested) || !found(folder.path + name))
                return false;
        }
        return true;
    };
    // Each root, then every folder below it in walk order; a folder's games go on as soon as it is listed.
    for (const QString& root : {m_locations.gamesFolder, m_locations.programFolder}) {
        if (root.isEmpty())
            continue;
        if (stopped(hooks.stopRequested) || !FolderWalk::WalkFolderTree(root, handFiles))
            return false;
    }
    return true;
}

QStringList GameDiscovery::WindowsGameFiles() const
{
    return WindowsGames::Files(m_locations);
}

DiscoveryResult GameDiscovery::Run(const DiscoveryHooks& hooks)
{
    DiscoveryResult result;
    m_builder.beginPass();
    const auto endPass = qScopeGuard([this] { m_builder.endPass(); });
    ListedPaths listedPaths;

    // Each item is handed on, then the window may run its events, then the closing flag is looked at.
    const auto handOn = [&](const GameEntry& entry) {
        if (hooks.addItem)
            hooks.addItem(entry);
        if (hooks.letEventsRun)
            hooks.letEventsRun();
        ++result.items;
        if (entry.source == IconSource::Queued)
            ++result.queuedIcons;
        result.stopped = stopped(hooks.stopRequested);
        return !result.stopped;
    };

    // The list is emptied, and the online games entry shown, when the first installed game is found (or
    // after the walk when there is none): the user sees the first games while the walk goes on.
    bool listStarted = false;
    const auto startList = [&] {
        if (listStarted)
            return true;
        listStarted = true;
        if (hooks.clearList)
            hooks.clearList();
        const GameEntry online = m_builder.OnlineGamesEntry();
        listedPaths.append(UpperCased(online.path));
        return handOn(online);
    };
    const bool walked = ForEachInstalledGameFile(
        [&](const QString& path) {
            if (!startList())
                return false;
            listedPaths.append(UpperCased(path));
            return handOn(m_builder.AddGameToList(path));
        },
        hooks);
    if (!walked || stopped(hooks.stopRequested)) {
        result.stopped = true;
        return result;
    }
    if (!startList())
        return result;

    for (const QString& path : WindowsGameFiles()) {
        listedPaths.append(UpperCased(path));
        if (!handOn(m_builder.AddGameToList(path)))
            return result;
    }

    // A path already listed, or any piece of a listed path, is left out; the accumulator is not extended
    // here, so an entry the user added twice is listed twice.
    const auto addedGames = m_builder.addedGames().games();
    for (const auto& game : addedGames) {
        const QString path = game.path.trimmed();
        if (listedPaths.containsPiece(UpperCased(path)))
            continue;
        if (!handOn(m_builder.AddGameToList(path)))
            return result;
    }
    return result;
}

} // namespace Brimvault
