#include "i18n/BuiltInTexts.h"

#include "i18n/PublisherGames.h"

#include <array>

namespace Brimvault {

namespace {

struct NumberedText {
    int number;
    const char16_t* text;
};

constexpr std::array kBuiltInTexts {
    // Language selection dialog
    NumberedText {10, u"Program language"},
    NumberedText {20, u"Please, select the language:"},
    NumberedText {30, u"OK"},
    NumberedText {40, u"Cancel"},
    NumberedText {50, u"Language files not found"},
    // Main window title area
    NumberedText {690, u"Copyright \u00A9 Brimvault Games. All rights reserved."},
    // Adding, removing and renaming games
    NumberedText {720, u"files"},
    NumberedText {725, u"All"},
    NumberedText {730, u"Add game file"},
    NumberedText {750, u"Add games from folder"},
    NumberedText {760, u"Remove "},
    NumberedText {770, u"Edit game name"},
    // Main window captions, menus and messages
    NumberedText {1010, u"Actions"},
    NumberedText {1020, u"Brimvault"},
    NumberedText {1060, u"Actions"},
    NumberedText {1070, u"Add game file..."},
    NumberedText {1080, u"Add games from folder..."},
    NumberedText {1085, u"Install game..."},
    NumberedText {1090, u"Remove game..."},
    NumberedText {1100, u"Remove all added games..."},
    NumberedText {1110, u"Help..."},
    NumberedText {1130, u"About..."},
    NumberedText {1150, u"Rename game"},
    NumberedText {1160, u"Remove game..."},
    NumberedText {1180, u"Language..."},
    NumberedText {1200, u"Get more games..."},
    NumberedText {1210, u"Advertising"},
    NumberedText {1220, u"There was an error! The game isn't installed!"},
    NumberedText {1250, u"Online games"},
    NumberedText {1260, u"There was an error! The game isn't removed!"},
    NumberedText {1270, u"Open game offline"},
    // Finding, ordering and the play history
    NumberedText {1300, u"Find a game"},
    NumberedText {1310, u"Order"},
    NumberedText {1320, u"As found"},
    NumberedText {1330, u"By name"},
    NumberedText {1340, u"Recently played"},
    NumberedText {1350, u"Never played"},
    NumberedText {1360, u"Last played %date%, played for %time% (%count% times)"},
    NumberedText {1370, u"%h% h %m% min"},
    NumberedText {1380, u"%m% min"},
    // Internet games that come with Windows
    NumberedText {2010, u"Internet Nardi"},
    NumberedText {2020, u"Internet Shashki"},
    NumberedText {2030, u"Internet Chervi"},
    NumberedText {2040, u"Internet Reversi"},
    NumberedText {2050, u"Internet Piki"},
};

bool IsPublisherGameNumber(int number)
{
    return number >= kFirstPublisherGameText && number < kFirstPublisherGameText + kPublisherGameCount;
}

} // namespace

QString BuiltInText(int number)
{
    if (IsPublisherGameNumber(number))
        return PublisherGameName(number - kFirstPublisherGameText);
    for (const NumberedText& entry : kBuiltInTexts) {
        if (entry.number == number)
            return QString::fromUtf16(entry.text);
    }
    return {};
}

QList<int> BuiltInTextNumbers()
{
    QList<int> numbers;
    numbers.reserve(kBuiltInTexts.size() + kPublisherGameCount);
    for (const NumberedText& entry : kBuiltInTexts)
        numbers.append(entry.number);
    for (int i = 0; i < kPublisherGameCount; ++i)
        numbers.append(kFirstPublisherGameText + i);
    return numbers;
}

} // namespace Brimvault
