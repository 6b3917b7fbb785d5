#include "catalogue/GameFileRules.h"
#include "catalogue/GameNames.h"
#include "catalogue/IconCacheKey.h"
#include "catalogue/ListedPaths.h"

#include "TestEnvironment.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

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
        const auto listed
            = [](const QString& piece,
                  const QStringList& paths = {u"C:\\GAMES\\CHESS\\CHESS.EXE"_s, u"D:\\ARCADE\\PONG.EXE"_s}) -> QString {
            ListedPaths listedPaths;
            for (const QString& path : paths)
                listedPaths.append(path);
            return listedPaths.containsPiece(piece) ? u"yes"_s : u"no"_s;
        };
        const QString prefix = u"Исполняемый файл для игры"_s;
        QTest::newRow("russian prefix cut") << tidy(prefix + u" Chess"_s) << u"Chess"_s;
        QTest::newRow("prefix elsewhere kept") << tidy(u"A "_s + prefix) << u"A "_s + prefix;
        QTest::newRow("12 unbroken") << tidy(u"ABCDEFGHIJKL"_s) << u"ABCDEFGHIJKL"_s;
        QTest::newRow("13 broken after 12") << tidy(u"ABCDEFGHIJKLM"_s) << u"ABCDEFGHIJKL M"_s;
        QTest::newRow("blanks unbroken") << tidy(u"Solitaire Collection Deluxe"_s) << u"Solitaire Collection Deluxe"_s;
        QTest::newRow("30 kept") << tidy(u"Thirty characters long name ok"_s) << u"Thirty characters long name ok"_s;
        QTest::newRow("31 cut") << tidy(u"Thirty-one characters long name"_s) << u"Thirty-one characters long nam..."_s;
        QTest::newRow("prefix, break, cut")
            << tidy(prefix + u' ' + QString(40, u'x')) << u"xxxxxxxxxxxx xxxxxxxxxxxx xxxxxx..."_s;
        QTest::newRow("zone table, any case") << zone(u"HRTZZM"_s) << u"Internet Chervi"_s;
        QTest::newRow("publisher game, built-in language") << zone(u"sudoku"_s) << QString();
        QTest::newRow("key, worked example") << cacheFile(u"C:\\G.exe"_s) << u"/c/G325331.ico"_s;
        QTest::newRow("key, no extension") << cacheFile(u"ab"_s) << u"/c/AB9798.ico"_s;
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
        QTest::newRow("piece of uninst.exe") << names(u"t.exe"_s) << u"01"_s;
        QTest::newRow("setup any case") << names(u"GameSETUP.exe"_s) << u"01"_s;
        QTest::newRow("installer") << names(u"Install.exe"_s) << u"01"_s;
        QTest::newRow("similar but longer") << names(u"xuninst.exe"_s) << u"11"_s;
        QTest::newRow("nothing listed, empty piece") << listed(QString(), {}) << u"yes"_s;
        QTest::newRow("nothing listed") << listed(u"C:\\A.EXE"_s, {}) << u"no"_s;
        QTest::newRow("end of one and start of the next") << listed(u"EXE\tD:\\AR"_s) << u"yes"_s;
        QTest::newRow("leading tab") << listed(u"\tC:\\GAMES"_s) << u"yes"_s;
        QTest::newRow("other case") << listed(u"c:\\games"_s) << u"no"_s;
        QTest::newRow("one character") << listed(u"P"_s) << u"yes"_s;
        QTest::newRow("every run present, order not") << listed(u"GAMESARCADE"_s) << u"no"_s;
        QTest::newRow("runs across two paths") << listed(u".EXED:\\A"_s) << u"no"_s;
    }
    void rules()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }
};
BV_REGISTER_TEST(TestGameRules);
#include "tst_gamerules.moc"
