// The catalogue's pure rules: names, icon cache keys, which files are games, finding, orders, play history.
#include "catalogue/CatalogueListing.h"
#include "catalogue/GameFileRules.h"
#include "catalogue/GameFinder.h"
#include "catalogue/GameNames.h"
#include "catalogue/IconCacheKey.h"
#include "catalogue/ListOrder.h"
#include "catalogue/ListedPaths.h"
#include "catalogue/PlayHistoryText.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QTimeZone>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// Games named by their captions, each under C:\Games; the captions of a list joined by ",".
QList<GameEntry> entries(const QStringList& captions)
{
    QList<GameEntry> list;
    for (const QString& caption : captions) {
        GameEntry entry;
        entry.caption = caption;
        entry.path = u"C:\\Games\\"_s + caption + u".exe"_s;
        list.append(entry);
    }
    return list;
}
QString captions(const QList<GameEntry>& list)
{
    QStringList result;
    for (const GameEntry& entry : list)
        result.append(entry.caption);
    return result.join(u',');
}

} // namespace

class TestGameRules : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void rules_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const auto tidy = &GameNames::TidyName;
        const auto zone = &GameNames::BuiltInName;
        // The icon cache file, its name summed over the path in the code page of the user's locale (summed by
        // hand from the code page tables: windows-1251 И = 0xC8, г = 0xE3, ...); none without a cache folder.
        const auto cacheFile = [](const QString& path, const QByteArray& locale = QByteArray()) -> QString {
            TestEnvironment env;
            if (!locale.isEmpty())
                env.setLocale(locale);
            return IconCacheFile(u"/c/"_s, path) + IconCacheFile(QString(), path);
        };
        // Whether discovery lists the file, and whether a folder scan takes its extension.
        const auto names = [](const QString& name) -> QString {
            return QString::number(GameFileRules::IsDiscoverableExecutable(name))
                + QString::number(GameFileRules::HasAcceptedExtension(name));
        };
        // "Is this a piece of what was listed" answers as a substring search over the tab-joined paths does.
        const auto listed = [](const QString& piece, bool any = true) -> QString {
            ListedPaths listedPaths;
            for (const QString& path : {u"C:\\GAMES\\CHESS\\CHESS.EXE"_s, u"D:\\ARCADE\\PONG.EXE"_s})
                if (any)
                    listedPaths.append(path);
            return listedPaths.containsPiece(piece) ? u"yes"_s : u"no"_s;
        };
        const auto found = [](const QString& caption, const QString& path, const QString& typed) -> QString {
            return GameFinder::Query(typed).matches(GameFinder::MakeFindKey(caption, path)) ? u"yes"_s : u"no"_s;
        };
        // Played: Game 2 in 2020, alpha in 2024 (stored under a path in other letter case); edge's value is damaged.
        const auto sorted = [](ListOrder order) -> QString {
            TestEnvironment env;
            WriteFile(env.settingsFile(),
                "[PlayHistory]\nc:|games|game 2.exe=3,600,2020-05-01T10:00:00Z\n"
                "C:|GAMES|ALPHA.EXE=1,60,2024-01-01T00:00:00Z\nc:|games|edge.exe=1,2,yesterday\n");
            QList<GameEntry> list = entries({u"zeta"_s, u"Éclair"_s, u"alpha"_s, u"Game 10"_s, u"Game 2"_s, u"edge"_s});
            ListOrders::Sort(list, order, PlayHistory::ReadAll());
            return captions(list);
        };
        // A damaged history value reads as never played; the next launch starts the count afresh.
        const auto damaged = [](const QString& value) -> QString {
            TestEnvironment env;
            const QString game = u"C:\\Games\\Chess.exe"_s;
            SaveSetting(AppTitle(), PlayHistory::Section, PlayHistory::KeyFor(game), value);
            const QString summary = PlayHistoryText::Summary(PlayHistory::Read(game));
            PlayHistory::RecordLaunch(game, QDateTime(QDate(2026, 11, 23), QTime(23, 15, 42), QTimeZone::utc()));
            return summary + u'|' + GetSetting(AppTitle(), PlayHistory::Section, PlayHistory::KeyFor(game));
        };
        const QString prefix = u"Исполняемый файл для игры"_s;
        QTest::newRow("russian prefix cut") << tidy(prefix + u" Chess"_s) << u"Chess"_s;
        QTest::newRow("prefix elsewhere kept") << tidy(u"A "_s + prefix) << u"A "_s + prefix;
        QTest::newRow("12 unbroken") << tidy(u"ABCDEFGHIJKL"_s) << u"ABCDEFGHIJKL"_s;
        QTest::newRow("13 broken after 12") << tidy(u"ABCDEFGHIJKLM"_s) << u"ABCDEFGHIJKL M"_s;
        QTest::newRow("blanks unbroken") << tidy(u"Solitaire Collection Deluxe"_s) << u"Solitaire Collection Deluxe"_s;
        QTest::newRow("30 kept") << tidy(u"Thirty characters long name ok"_s) << u"Thirty characters long name ok"_s;
        QTest::newRow("31 cut") << tidy(u"Thirty-one characters long name"_s) << u"Thirty-one characters long nam..."_s;
        QTest::newRow("zone table, any case") << zone(u"HRTZZM"_s) << u"Internet Chervi"_s;
        QTest::newRow("publisher game, built-in language") << zone(u"sudoku"_s) << QString();
        QTest::newRow("key, worked example") << cacheFile(u"C:\\G.exe"_s) << u"/c/G325331.ico"_s;
        QTest::newRow("key, eight-bit code") << cacheFile(u"é"_s) << u"/c/É2330.ico"_s;
        QTest::newRow("key, outside the code page") << cacheFile(u"ж"_s) << u"/c/Ж630.ico"_s;
        QTest::newRow("key, empty") << cacheFile(QString()) << u"/c/00.ico"_s;
        QTest::newRow("key, Russian") << cacheFile(u"/home/u/Игры/Пасьянс/game.exe"_s, "ru_RU")
                                      << u"/c/GAME20232107.ico"_s;
        QTest::newRow("key, Polish") << cacheFile(u"/home/u/Gry/Łódź/gra.exe"_s, "pl_PL") << u"/c/GRA11581272.ico"_s;
        QTest::newRow("game") << names(u"game.exe"_s) << u"11"_s;
        QTest::newRow("upper-case extension") << names(u"GAME.EXE"_s) << u"11"_s;
        QTest::newRow("flash movie") << names(u"a.SWF"_s) << u"01"_s;
        QTest::newRow("extension inside name") << names(u"game.exe.txt"_s) << u"00"_s;
        QTest::newRow("dot in folder only") << names(u"dir.exe\\file"_s) << u"00"_s;
        QTest::newRow("program itself any case") << names(u"brimvault.EXE"_s) << u"01"_s;
        QTest::newRow("the service") << names(u"BrimvaultService.exe"_s) << u"01"_s;
        QTest::newRow("piece of uninst.exe") << names(u"t.exe"_s) << u"01"_s;
        QTest::newRow("setup any case") << names(u"GameSETUP.exe"_s) << u"01"_s;
        QTest::newRow("installer") << names(u"Install.exe"_s) << u"01"_s;
        QTest::newRow("similar but longer") << names(u"xuninst.exe"_s) << u"11"_s;
        QTest::newRow("nothing listed") << listed(u"C:\\A.EXE"_s, false) << u"no"_s;
        QTest::newRow("end of one and start of the next") << listed(u"EXE\tD:\\AR"_s) << u"yes"_s;
        QTest::newRow("leading tab") << listed(u"\tC:\\GAMES"_s) << u"yes"_s;
        QTest::newRow("other case") << listed(u"c:\\games"_s) << u"no"_s;
        QTest::newRow("every run present, order not") << listed(u"GAMESARCADE"_s) << u"no"_s;
        QTest::newRow("runs across two paths") << listed(u".EXED:\\A"_s) << u"no"_s;
        QTest::newRow("find, letter case") << found(u"Super Mario"_s, u"C:\\g\\sm.exe"_s, u"MARIO"_s) << u"yes"_s;
        QTest::newRow("find, accents in caption")
            << found(u"Pokémon Café"_s, u"x.exe"_s, u"pokemon cafe"_s) << u"yes"_s;
        QTest::newRow("find, cyrillic yo and case") << found(u"Ёлочка"_s, u"x.exe"_s, u"ЕЛО"_s) << u"yes"_s;
        QTest::newRow("find, polish l") << found(u"Łódź Rally"_s, u"x.exe"_s, u"lodz"_s) << u"yes"_s;
        QTest::newRow("find, caption broken for wrapping")
            << found(u"SuperMarioBr os"_s, u"x.exe"_s, u"bros"_s) << u"yes"_s;
        QTest::newRow("find, two words of file name")
            << found(u"Racer"_s, u"/g/need_for_speed.exe"_s, u"for sp"_s) << u"yes"_s;
        QTest::newRow("find, capital starts a word")
            << found(u"X"_s, u"C:\\g\\HeroesOfMight.exe"_s, u"might"_s) << u"yes"_s;
        QTest::newRow("find, inside a file name word") << found(u"X"_s, u"C:\\g\\heroes.exe"_s, u"roes"_s) << u"no"_s;
        QTest::newRow("find, folder is not the name") << found(u"X"_s, u"C:\\speedy\\x.exe"_s, u"speed"_s) << u"no"_s;
        QTest::newRow("find, extension is not the name") << found(u"X"_s, u"C:\\g\\x.exe"_s, u"exe"_s) << u"no"_s;
        QTest::newRow("find, blanks find all") << found(u"Chess"_s, u"chess.exe"_s, u"   "_s) << u"yes"_s;
        QTest::newRow("order as found") << sorted(ListOrder::AsFound) << u"zeta,Éclair,alpha,Game 10,Game 2,edge"_s;
        QTest::newRow("order by name") << sorted(ListOrder::ByName) << u"alpha,Éclair,edge,Game 2,Game 10,zeta"_s;
        QTest::newRow("order recently played")
            << sorted(ListOrder::RecentlyPlayed) << u"alpha,Game 2,zeta,Éclair,Game 10,edge"_s;
        QTest::newRow("listing narrows after ordering") << captions(CatalogueListing::ShownEntries(
            entries({u"Mine Sweeper"_s, u"Chess"_s, u"Minecart"_s}), u"mine"_s, ListOrder::ByName, {}))
                                                        << u"Mine Sweeper,Minecart"_s;
        QTest::newRow("history in words") << damaged(u"often"_s) << u"Never played|1,0,2026-11-23T23:15:42Z"_s;
        QTest::newRow("history, bad date")
            << damaged(u"3,120,2026-13-45T99:00:00Z"_s) << u"Never played|1,0,2026-11-23T23:15:42Z"_s;
    }
    void rules()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    void historyFollowsThePathWithoutCase()
    {
        TestEnvironment env;
        PlayHistory::RecordLaunch(u"C:\\Games\\Chess.exe"_s, QDateTime::currentDateTimeUtc());
        PlayHistory::AddPlayTime(u" c:\\games\\CHESS.EXE"_s, 11520);
        PlayHistory::RecordLaunch(u"c:\\GAMES\\chess.exe"_s, QDateTime::currentDateTimeUtc());
        const PlayRecord record = PlayHistory::Read(u"C:\\Games\\Chess.exe"_s);
        QCOMPARE(record.launches, 2);
        QVERIFY(PlayHistoryText::Summary(record).endsWith(u", played for 3 h 12 min (2 times)"_s));
        QCOMPARE(PlayHistoryText::Duration(59 * 60 + 59), u"59 min"_s);
        PlayHistory::Forget(u"C:\\GAMES\\Chess.exe"_s);
        QVERIFY(PlayHistory::Read(u"C:\\Games\\Chess.exe"_s).isEmpty());
    }
};
BV_REGISTER_TEST(TestGameRules);
#include "tst_gamerules.moc"
