#pragma once

#include "catalogue/GameEntry.h"
#include "store/PlayHistory.h"

#include <QHash>
#include <QList>
#include <QString>

#include <optional>

namespace Brimvault {

// The order of the list. AsFound is the order discovery finds the games in, the list's own.
enum class ListOrder { AsFound, ByName, RecentlyPlayed };

namespace ListOrders {

// "found", "name", "recent": the names on the command line and in the settings store.
QString Name(ListOrder order);
std::optional<ListOrder> FromName(const QString& name);

// Settings store "Settings", "ListOrder"; AsFound when missing or unknown.
ListOrder Stored();
void Store(ListOrder order);

// By name: locale-aware, ignoring letter case and accents. Recently played: last played first, then the games
// never played in the order found. Both keep the found order among equals.
void Sort(QList<GameEntry>& entries, ListOrder order, const QHash<QString, PlayRecord>& history);

} // namespace ListOrders
} // namespace Brimvault
