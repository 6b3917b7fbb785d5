#pragma once

#include <QString>

namespace Brimvault {

// The publisher's own games, which get their display names from the language file: the game at index i
// (from 0) is translated under text number kFirstPublisherGameText + i.
constexpr int kFirstPublisherGameText = 5001;
constexpr int kPublisherGameCount = 26;

// The file titles (file names without extension) of the publisher's games, comma-separated, in index order.
QString MakerGameList();

// The English display name of the game at that index, or an empty text outside the list.
QString PublisherGameName(int index);

} // namespace Brimvault
