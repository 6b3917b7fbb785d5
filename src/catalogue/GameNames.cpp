#include "catalogue/GameNames.h"

#include "i18n/PublisherGames.h"
#include "i18n/modLocalizer.h"
#include "support/TextCase.h"

#include <QStringList>

#include <array>

namespace Brimvault::GameNames {

namespace {

struct ZoneGame {
    const char16_t* fileTitle;
    const char16_t* builtInName;
    int textNumber;
};

constexpr std::array<ZoneGame, 5> kZoneGames {{
    {u"bckgzm", u"Internet Nardi", 2010},
    {u"chkrzm", u"Internet Shashki", 2020},
    {u"hrtzzm", u"Internet Chervi", 2030},
    {u"Rvsezm", u"Internet Reversi", 2040},
    {u"shvlzm", u"Internet Piki", 2050},
}};

constexpr QStringView kZoneMembership = u"*bckgzm*chkrzm*hrtzzm*Rvsezm*shvlzm*";
constexpr QStringView kRussianPrefix = u"Исполняемый файл для игры ";
constexpr qsizetype kLongestName = 30;

QString zoneName(const QString& fileTitle)
{
    for (const ZoneGame& game : kZoneGames) {
        if (fileTitle.compare(QStringView(game.fileTitle), Qt::CaseInsensitive) == 0)
            return modLocalizer::Translate(game.textNumber, QString::fromUtf16(game.builtInName));
    }
    return QString();
}

QString publisherName(const QString& fileTitle)
{
    const QStringList titles = MakerGameList().split(u',');
    for (qsizetype i = 0; i < titles.size(); ++i) {
        if (titles.at(i).compare(fileTitle, Qt::CaseInsensitive) == 0)
            return modLocalizer::Translate(kFirstPublisherGameText + int(i), QString());
    }
    return QString();
}

} // namespace

QString BuiltInName(const QString& fileTitle)
{
    const QString title = UpperCased(fileTitle);
    // Membership is a substring test, so a title such as "zm" is a member that matches no row.
    static const QString membership = kZoneMembership.toString().toUpper();
    if (membership.contains(title))
        return zoneName(fileTitle);
    static const QString makerList = u',' + MakerGameList().toUpper() + u',';
    if (makerList.contains(u',' + title + u','))
        return publisherName(fileTitle);
    return QString();
}

QString TidyName(const QString& name)
{
    QString tidy = name;
    if (tidy.startsWith(kRussianPrefix))
        tidy = tidy.mid(kRussianPrefix.size());
    if (tidy.size() > kLongestName)
        tidy = tidy.left(kLongestName) + QStringLiteral("...");
    if (tidy.size() > 12 && !tidy.contains(u' ')) {
        tidy.insert(12, u' ');
        if (tidy.size() > 25 && tidy.indexOf(u' ', 25) < 0)
            tidy.insert(25, u' ');
    }
    return tidy;
}

} // namespace Brimvault::GameNames
