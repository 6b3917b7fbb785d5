#pragma once

#include "catalogue/CatalogueLocations.h"

#include <QStringList>

#include <functional>

namespace Brimvault {

struct GameEntry;
class ListBuilder;

// What the window lends discovery: its closing flag, its list, and the chance to let pending events run
// after each item and each folder listed (the core never processes events itself).
struct DiscoveryHooks {
    std::function<bool()> stopRequested;
    std::function<void()> clearList;
    std::function<void(const GameEntry&)> addItem;
    std::function<void()> letEventsRun;
};

struct DiscoveryResult {
    bool stopped = false;
    int items = 0;
    int queuedIcons = 0;
};

// Fills the list from nothing, in the fixed order of sources: the online games entry, the games of the
// games folder and the program folder, the games that come with Windows, the games added by hand.
class GameDiscovery {
public:
    GameDiscovery(ListBuilder& builder, CatalogueLocations locations);

    DiscoveryResult Run(const DiscoveryHooks& hooks);

    // Takes one found file; false stops discovery.
    using FileSink = std::function<bool(const QString&)>;

    // The executables (and, inside the games folder, Flash movies) of the games folder and the program
    // folder, each with every folder below it, in walk order, each handed to `found` as soon as its folder
    // is listed. False when stopped.
    bool ForEachInstalledGameFile(const FileSink& found, const DiscoveryHooks& hooks) const;
    // The classic games of the Windows folder, the Microsoft Games (or Gaming Zone) folder, Pinball.
    QStringList WindowsGameFiles() const;

private:
    ListBuilder& m_builder;
    CatalogueLocations m_locations;
};

} // namespace Brimvault
