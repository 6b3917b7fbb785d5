#pragma once

class QIcon;
class QPixmap;

namespace Brimvault::StockPictures {

// The window's own pictures, drawn rather than shipped so that they stay sharp at every size: the online
// games entry, Flash movies, games without an icon of their own, the further list picture, the Actions
// button and the program's icon.
QPixmap OnlineGames(int size = 32);
QPixmap FlashMovie(int size = 32);
QPixmap NoIcon(int size = 32);
QPixmap GbStels(int size = 32);
QPixmap ActionsButton(int size = 32);
QIcon ProgramIcon();

} // namespace Brimvault::StockPictures
