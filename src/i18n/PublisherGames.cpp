#include "i18n/PublisherGames.h"

#include <array>

namespace Brimvault {

namespace {

struct PublisherGame {
    const char16_t* fileTitle;
    const char16_t* englishName;
};

constexpr std::array<PublisherGame, kPublisherGameCount> kPublisherGames {{
    {u"lines", u"Color Lines"},
    {u"mahjong", u"Mahjong Garden"},
    {u"sudoku", u"Sudoku Master"},
    {u"tetrix", u"Falling Blocks"},
    {u"bubbles", u"Bubble Shooter"},
    {u"marblepath", u"Marble Path"},
    {u"sapper", u"Sapper"},
    {u"klondike", u"Klondike Solitaire"},
    {u"pyramid", u"Pyramid Solitaire"},
    {u"chess3d", u"Chess 3D"},
    {u"checkers", u"Checkers"},
    {u"backgammon", u"Backgammon"},
    {u"reversi", u"Reversi"},
    {u"jigsaw", u"Jigsaw Puzzles"},
    {u"memory", u"Memory Cards"},
    {u"snake", u"Snake"},
    {u"brickbreaker", u"Brick Breaker"},
    {u"mazechase", u"Maze Chase"},
    {u"fifteen", u"Fifteen Puzzle"},
    {u"wordsearch", u"Word Search"},
    {u"hiddenobjects", u"Hidden Objects"},
    {u"happyfarm", u"Happy Farm"},
    {u"aquarium", u"Aquarium"},
    {u"streetracer", u"Street Racer"},
    {u"jewelmatch", u"Jewel Match"},
    {u"airhockey", u"Air Hockey"},
}};

} // namespace

QString MakerGameList()
{
    QString list;
    for (const PublisherGame& game : kPublisherGames) {
        if (!list.isEmpty())
            list += u',';
        list += QString::fromUtf16(game.fileTitle);
    }
    return list;
}

QString PublisherGameName(int index)
{
    if (index < 0 || index >= kPublisherGameCount)
        return {};
    return QString::fromUtf16(kPublisherGames[static_cast<std::size_t>(index)].englishName);
}

} // namespace Brimvault
