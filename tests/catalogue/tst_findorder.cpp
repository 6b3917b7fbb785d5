// Finding games by typed text, the orders of the list, and the play history as the settings store keeps it.
#include "catalogue/CatalogueListing.h"
#include "catalogue/GameFinder.h"
#include "catalogue/ListOrder.h"
#include "catalogue/PlayHistoryText.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QTimeZone>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestFindOrder : public QObject {
    Q_OBJECT

    static QList<GameEntry> entries(const QStringList& captions)
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
    static QStringList captions(const QList<GameEntry>& list)
    {
        QStringList result;
        for (const GameEntry& entry : list)
            result.append(entry.caption);
        return result;
    }

private Q_SLOTS:
    void finding_data()
    {
        QTest::addColumn<QString>("caption");
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("typed");
        QTest::addColumn<bool>("found");
        QTest::newRow("letter case") << u"Super Mario"_s << u"C:\\g\\sm.exe"_s << u"MARIO"_s << true;
        QTest::newRow("accents in caption") << u"Pokémon Café"_s << u"x.exe"_s << u"pokemon cafe"_s << true;
        QTest::newRow("accents typed") << u"Cafe"_s << u"x.exe"_s << u"CAFÉ"_s << true;
        QTest::newRow("cyrillic yo") << u"Ёлочка"_s << u"x.exe"_s << u"ело"_s << true;
        QTest::newRow("cyrillic case") << u"Сапёр"_s << u"x.exe"_s << u"САПЕР"_s << true;
        QTest::newRow("polish l") << u"Łódź Rally"_s << u"x.exe"_s << u"lodz"_s << true;
        QTest::newRow("caption broken for wrapping") << u"SuperMarioBr os"_s << u"x.exe"_s << u"bros"_s << true;
        QTest::newRow("word start of file name") << u"Racer"_s << u"C:\\g\\need_for_speed.exe"_s << u"spe"_s << true;
        QTest::newRow("two words of file name") << u"Racer"_s << u"/g/need_for_speed.exe"_s << u"for sp"_s << true;
        QTest::newRow("capital starts a word") << u"X"_s << u"C:\\g\\HeroesOfMight.exe"_s << u"might"_s << true;
        QTest::newRow("inside a file name word") << u"X"_s << u"C:\\g\\heroes.exe"_s << u"roes"_s << false;
        QTest::newRow("folder is not the name") << u"X"_s << u"C:\\speedy\\x.exe"_s << u"speed"_s << false;
        QTest::newRow("extension is not the name") << u"X"_s << u"C:\\g\\x.exe"_s << u"exe"_s << false;
        QTest::newRow("no match") << u"Chess"_s << u"chess.exe"_s << u"mine"_s << false;
        QTest::newRow("empty finds all") << u"Chess"_s << u"chess.exe"_s << QString() << true;
        QTest::newRow("blanks find all") << u"Chess"_s << u"chess.exe"_s << u"   "_s << true;
    }
    void finding()
    {
        QFETCH(QString, caption);
        QFETCH(QString, path);
        QFETCH(QString, typed);
        QFETCH(bool, found);
        QCOMPARE(GameFinder::Query(typed).matches(GameFinder::MakeFindKey(caption, path)), found);
    }

    void ordering_data()
    {
        QTest::addColumn<int>("order");
        QTest::addColumn<QStringList>("found");
        QTest::addColumn<QStringList>("expected");
        const QStringList games {u"zeta"_s, u"Éclair"_s, u"alpha"_s, u"Game 10"_s, u"Game 2"_s, u"edge"_s};
        QTest::newRow("as found") << int(ListOrder::AsFound) << games << games;
        QTest::newRow("by name") << int(ListOrder::ByName) << games
                                 << QStringList {
                                        u"alpha"_s, u"Éclair"_s, u"edge"_s, u"Game 2"_s, u"Game 10"_s, u"zeta"_s};
        // Played: Game 2 in 2020, alpha in 2024 (stored under a path in other letter case); edge's value is damaged.
        QTest::newRow("recently played") << int(ListOrder::RecentlyPlayed) << games
                                         << QStringList {u"alpha"_s, u"Game 2"_s, u"zeta"_s, u"Éclair"_s, u"Game 10"_s,
                                                u"edge"_s};
    }
    void ordering()
    {
        QFETCH(int, order);
        QFETCH(QStringList, found);
        QFETCH(QStringList, expected);
        TestEnvironment env;
        QVERIFY(WriteFile(env.settingsFile(),
            "[PlayHistory]\n"
            "c:|games|game 2.exe=3,600,2020-05-01T10:00:00Z\n"
            "C:|GAMES|ALPHA.EXE=1,60,2024-01-01T00:00:00Z\n"
            "c:|games|edge.exe=1,2,yesterday\n"));
        QList<GameEntry> list = entries(found);
        ListOrders::Sort(list, ListOrder(order), PlayHistory::ReadAll());
        QCOMPARE(captions(list), expected);
    }

    void damagedHistoryValues_data()
    {
        QTest::addColumn<QString>("value");
        QTest::newRow("words") << u"often"_s;
        QTest::newRow("two fields") << u"3,120"_s;
        QTest::newRow("negative time") << u"3,-5,"_s;
        QTest::newRow("bad date") << u"3,120,2026-13-45T99:00:00Z"_s;
    }
    void damagedHistoryValues()
    {
        QFETCH(QString, value);
        TestEnvironment env;
        const QString game = u"C:\\Games\\Chess.exe"_s;
        QVERIFY(SaveSetting(AppTitle(), PlayHistory::Section, PlayHistory::KeyFor(game), value));
        QVERIFY(PlayHistory::Read(game).isEmpty());
        QCOMPARE(PlayHistoryText::Summary(PlayHistory::Read(game)), u"Never played"_s);
        // The next launch starts the count afresh.
        PlayHistory::RecordLaunch(game, QDateTime(QDate(2026, 11, 23), QTime(23, 15, 42), QTimeZone::utc()));
        QCOMPARE(
            GetSetting(AppTitle(), PlayHistory::Section, PlayHistory::KeyFor(game)), u"1,0,2026-11-23T23:15:42Z"_s);
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

    void listingNarrowsAfterOrdering()
    {
        const QList<GameEntry> shown = CatalogueListing::ShownEntries(
            entries({u"Mine Sweeper"_s, u"Chess"_s, u"Minecart"_s}), u"mine"_s, ListOrder::ByName, {});
        QCOMPARE(captions(shown), (QStringList {u"Mine Sweeper"_s, u"Minecart"_s}));
    }
};

BV_REGISTER_TEST(TestFindOrder);
#include "tst_findorder.moc"
