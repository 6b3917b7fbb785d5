#include "catalogue/GameDiscovery.h"

#include "catalogue/FolderWalk.h"
#include "catalogue/GameEntry.h"
#include "catalogue/GameFileRules.h"
#include "catalogue/ListBuilder.h"
#include "catalogue/ListedPaths.h"
#include "catalogue/WindowsGames.h"
#include "support/PathFunctions.h"

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

QStringList GameDiscovery::InstalledGameFiles(const std::function<bool()>& stopRequested) const
{
    QList<FolderWalk::WalkedFolder> folders;
    for (const QString& root : {m_locations.gamesFolder, m_locations.programFolder}) {
        if (root.isEmpty())
            continue;
        if (stopped(stopRequested))
            return {};
        folders.append({root, std::nullopt});
        folders.append(FolderWalk::CollectSubfolders(root));
    }

    const QString gamesFolder = m_locations.gamesFolder;
    const QString advertisingFolder
        = gamesFolder.isEmpty() ? QString() : gamesFolder + QStringLiteral("Reclama") + gamesFolder.back();
    QStringList files;
    for (const FolderWalk::WalkedFolder& folder : std::as_const(folders)) {
        const QStringList names = FolderWalk::FilesOf(folder);
        // The list builder looks for the games' info files and icons in this same listing.
        m_builder.sideFiles().remember(folder.path, names);
        for (const QString& name : names) {
            if (!GameFileRules::IsDiscoverableExecutable(name))
                continue;
            if (stopped(stopRequested))
                return {};
            files.append(folder.path + name);
        }
        const bool inGamesFolder = !gamesFolder.isEmpty() && folder.path.startsWith(gamesFolder, Qt::CaseInsensitive)
            && !folder.path.startsWith(advertisingFolder, Qt::CaseInsensitive);
        if (!inGamesFolder)
            continue;
        for (const QString& name : names) {
            if (!GameFileRules::HasExtension(name, QLatin1String("swf")))
                continue;
            if (stopped(stopRequested))
                return {};
            files.append(folder.path + name);
        }
    }
    return files;
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
        ++result.items;
        if (entry.source == IconSource::Queued)
            ++result.queuedIcons;
        result.stopped = stopped(hooks.stopRequested);
        return !result.stopped;
    };

    const QStringList installed = InstalledGameFiles(hooks.stopRequested);
    if (stopped(hooks.stopRequested)) {
        result.stopped = true;
        return result;
    }
    if (hooks.clearList)
        hooks.clearList();

    const GameEntry online = m_builder.OnlineGamesEntry();
    listedPaths.append(online.path.toUpper());
    if (!handOn(online))
        return result;

    for (const QString& path : installed) {
        listedPaths.append(path.toUpper());
        if (!handOn(m_builder.AddGameToList(path)))
            return result;
    }

    for (const QString& path : WindowsGameFiles()) {
        listedPaths.append(path.toUpper());
        if (!handOn(m_builder.AddGameToList(path)))
            return result;
    }

    // A path already listed, or any piece of a listed path, is left out; the accumulator is not extended
    // here, so an entry the user added twice is listed twice.
    const auto addedGames = m_builder.addedGames().games();
    for (const auto& game : addedGames) {
        const QString path = game.path.trimmed();
        if (listedPaths.containsPiece(path.toUpper()))
            continue;
        if (!handOn(m_builder.AddGameToList(path)))
            return result;
    }
    return result;
}

} // namespace Brimvault
