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
    // The tidied caption (t) and the built-in zone table (b).
    void names_data()
    {
        QTest::addColumn<char>("rule");
        QTest::addColumn<QString>("input");
        QTest::addColumn<QString>("expected");
        const QString prefix = u"Исполняемый файл для игры"_s;
        QTest::newRow("russian prefix cut") << 't' << prefix + u" Chess"_s << u"Chess"_s;
        QTest::newRow("prefix elsewhere kept") << 't' << u"A "_s + prefix << u"A "_s + prefix;
        QTest::newRow("12 unbroken") << 't' << u"ABCDEFGHIJKL"_s << u"ABCDEFGHIJKL"_s;
        QTest::newRow("13 broken after 12") << 't' << u"ABCDEFGHIJKLM"_s << u"ABCDEFGHIJKL M"_s;
        QTest::newRow("blanks unbroken") << 't' << u"Solitaire Collection Deluxe"_s << u"Solitaire Collection Deluxe"_s;
        QTest::newRow("30 kept") << 't' << u"Thirty characters long name ok"_s << u"Thirty characters long name ok"_s;
        QTest::newRow("31 cut") << 't' << u"Thirty-one characters long name"_s
                                << u"Thirty-one characters long nam..."_s;
        QTest::newRow("prefix, break, cut")
            << 't' << prefix + u' ' + QString(40, u'x') << u"xxxxxxxxxxxx xxxxxxxxxxxx xxxxxx..."_s;
        QTest::newRow("zone table, any case") << 'b' << u"HRTZZM"_s << u"Internet Chervi"_s;
        QTest::newRow("publisher game, built-in language") << 'b' << u"sudoku"_s << QString();
    }
    void names()
    {
        QFETCH(char, rule);
        QFETCH(QString, input);
        QTEST(rule == 't' ? GameNames::TidyName(input) : GameNames::BuiltInName(input), "expected");
    }

    // Sums over the path in the code page of the user's locale, summed by hand from the code page tables
    // (windows-1251: И = 0xC8, г = 0xE3, ...).
    void iconCacheKey_data()
    {
        QTest::addColumn<QByteArray>("locale");
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("key");
        QTest::newRow("worked example") << QByteArray() << u"C:\\G.exe"_s << u"G325331"_s;
        QTest::newRow("no extension") << QByteArray() << u"ab"_s << u"AB9798"_s;
        QTest::newRow("eight-bit code") << QByteArray() << u"é"_s << u"É2330"_s;
        QTest::newRow("outside the code page") << QByteArray() << u"ж"_s << u"Ж630"_s;
        QTest::newRow("empty") << QByteArray() << QString() << u"00"_s;
        QTest::newRow("Russian") << QByteArray("ru_RU") << u"/home/u/Игры/Пасьянс/game.exe"_s << u"GAME20232107"_s;
        QTest::newRow("Polish") << QByteArray("pl_PL") << u"/home/u/Gry/Łódź/gra.exe"_s << u"GRA11581272"_s;
    }
    void iconCacheKey()
    {
        QFETCH(QByteArray, locale);
        QFETCH(QString, path);
        QFETCH(QString, key);
        TestEnvironment env;
        if (!locale.isEmpty())
            env.setLocale(locale);
        QCOMPARE(IconCacheFile(u"/c/Icons/"_s, path), u"/c/Icons/"_s + key + u".ico"_s);
        QVERIFY(IconCacheFile(QString(), path).isEmpty());
    }

    void gameFileNames_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<bool>("discoverable");
        QTest::addColumn<bool>("scanned"); // the extensions a folder scan takes
        QTest::newRow("game") << u"game.exe"_s << true << true;
        QTest::newRow("upper-case extension") << u"GAME.EXE"_s << true << true;
        QTest::newRow("flash movie") << u"a.SWF"_s << false << true;
        QTest::newRow("extension inside name") << u"game.exe.txt"_s << false << false;
        QTest::newRow("dot in folder only") << u"dir.exe\\file"_s << false << false;
        QTest::newRow("program itself any case") << u"brimvault.EXE"_s << false << true;
        QTest::newRow("piece of uninst.exe") << u"t.exe"_s << false << true;
        QTest::newRow("setup any case") << u"GameSETUP.exe"_s << false << true;
        QTest::newRow("installer") << u"Install.exe"_s << false << true;
        QTest::newRow("similar but longer") << u"xuninst.exe"_s << true << true;
    }
    void gameFileNames()
    {
        QFETCH(QString, name);
        QTEST(GameFileRules::IsDiscoverableExecutable(name), "discoverable");
        QTEST(GameFileRules::HasAcceptedExtension(name), "scanned");
    }

    // "Is this a piece of what was listed" answers as a substring search over the tab-joined paths does.
    void listedPaths_data()
    {
        QTest::addColumn<QStringList>("listed");
        QTest::addColumn<QString>("piece");
        QTest::addColumn<bool>("contained");
        const QStringList two {u"C:\\GAMES\\CHESS\\CHESS.EXE"_s, u"D:\\ARCADE\\PONG.EXE"_s};
        QTest::newRow("nothing listed, empty piece") << QStringList() << QString() << true;
        QTest::newRow("nothing listed") << QStringList() << u"C:\\A.EXE"_s << false;
        QTest::newRow("end of one and start of the next") << two << u"EXE\tD:\\AR"_s << true;
        QTest::newRow("leading tab") << two << u"\tC:\\GAMES"_s << true;
        QTest::newRow("other case") << two << u"c:\\games"_s << false;
        QTest::newRow("one character") << two << u"P"_s << true;
        QTest::newRow("every run present, order not") << two << u"GAMESARCADE"_s << false;
        QTest::newRow("runs across two paths") << two << u".EXED:\\A"_s << false;
    }
    void listedPaths()
    {
        QFETCH(QStringList, listed);
        QFETCH(QString, piece);
        ListedPaths paths;
        for (const QString& path : std::as_const(listed))
            paths.append(path);
        QTEST(paths.containsPiece(piece), "contained");
    }
};
BV_REGISTER_TEST(TestGameRules);
#include "tst_gamerules.moc"
