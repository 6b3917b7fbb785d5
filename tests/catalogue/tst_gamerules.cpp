#include "catalogue/GameFileRules.h"
#include "catalogue/GameNames.h"
#include "catalogue/IconCacheKey.h"

#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestGameRules : public QObject {
    Q_OBJECT
private Q_SLOTS:
    // Names: the tidied caption, the built-in zone table, the icon cache key ("" when not applicable).
    void names_data()
    {
        QTest::addColumn<char>("rule"); // t: tidied name, b: built-in name, k: cache key
        QTest::addColumn<QString>("input");
        QTest::addColumn<QString>("expected");
        const QString prefix = u"Исполняемый файл для игры"_s;
        QTest::newRow("russian prefix cut") << 't' << prefix + u" Chess"_s << u"Chess"_s;
        QTest::newRow("prefix elsewhere kept") << 't' << u"A "_s + prefix << u"A "_s + prefix;
        QTest::newRow("prefix without blank kept") << 't' << prefix << prefix;
        QTest::newRow("12 unbroken") << 't' << u"ABCDEFGHIJKL"_s << u"ABCDEFGHIJKL"_s;
        QTest::newRow("13 broken after 12") << 't' << u"ABCDEFGHIJKLM"_s << u"ABCDEFGHIJKL M"_s;
        QTest::newRow("24 one break") << 't' << u"ABCDEFGHIJKLMNOPQRSTUVWX"_s << u"ABCDEFGHIJKL MNOPQRSTUVWX"_s;
        QTest::newRow("25 second break") << 't' << u"ABCDEFGHIJKLMNOPQRSTUVWXY"_s << u"ABCDEFGHIJKL MNOPQRSTUVWX Y"_s;
        QTest::newRow("blanks unbroken") << 't' << u"Solitaire Collection Deluxe"_s << u"Solitaire Collection Deluxe"_s;
        QTest::newRow("30 kept") << 't' << u"Thirty characters long name ok"_s << u"Thirty characters long name ok"_s;
        QTest::newRow("31 cut") << 't' << u"Thirty-one characters long name"_s
                                << u"Thirty-one characters long nam..."_s;
        QTest::newRow("prefix, break, cut")
            << 't' << prefix + u' ' + QString(40, u'x') << u"xxxxxxxxxxxx xxxxxxxxxxxx xxxxxx..."_s;
        QTest::newRow("zone hearts") << 'b' << u"hrtzzm"_s << u"Internet Chervi"_s;
        QTest::newRow("zone any case") << 'b' << u"RVSEZM"_s << u"Internet Reversi"_s;
        QTest::newRow("zone backgammon") << 'b' << u"bckgzm"_s << u"Internet Nardi"_s;
        QTest::newRow("member without row") << 'b' << u"zm"_s << QString();
        QTest::newRow("publisher game, built-in language") << 'b' << u"sudoku"_s << QString();
        QTest::newRow("worked example") << 'k' << u"C:\\G.exe"_s << u"G325331"_s;
        // Odd positions C \ . x = 67+92+46+120, even : G e e with "g" 103 instead of 71.
        QTest::newRow("sums use the path as given") << 'k' << u"C:\\g.exe"_s << u"G325363"_s;
        QTest::newRow("unix path") << 'k' << u"/a/b.exe"_s << u"B260397"_s;
        QTest::newRow("no extension") << 'k' << u"ab"_s << u"AB9798"_s;
        QTest::newRow("eight-bit code") << 'k' << u"é"_s << u"É2330"_s;
        QTest::newRow("outside the code page") << 'k' << u"ж"_s << u"Ж630"_s;
        QTest::newRow("empty") << 'k' << QString() << u"00"_s;
    }
    void names()
    {
        QFETCH(char, rule);
        QFETCH(QString, input);
        QFETCH(QString, expected);
        if (rule == 't')
            QCOMPARE(GameNames::TidyName(input), expected);
        if (rule == 'b')
            QCOMPARE(GameNames::BuiltInName(input), expected);
        if (rule != 'k')
            return;
        QCOMPARE(IconCacheKey(input), expected);
        QCOMPARE(IconCacheFile(u"/c/Icons/"_s, input), u"/c/Icons/"_s + expected + u".ico"_s);
        QVERIFY(IconCacheFile(QString(), input).isEmpty());
    }

    void gameFileNames_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<bool>("discoverable");
        QTest::addColumn<bool>("scanned"); // the extensions a folder scan takes
        QTest::newRow("game") << u"game.exe"_s << true << true;
        QTest::newRow("upper-case extension") << u"GAME.EXE"_s << true << true;
        QTest::newRow("flash movie") << u"a.SWF"_s << false << true;
        QTest::newRow("not an executable") << u"readme.txt"_s << false << false;
        QTest::newRow("extension inside name") << u"game.exe.txt"_s << false << false;
        QTest::newRow("no extension") << u"exe"_s << false << false;
        QTest::newRow("partial extension") << u"a.ex"_s << false << false;
        QTest::newRow("dot in folder only") << u"dir.exe\\file"_s << false << false;
        QTest::newRow("service") << u"BrimvaultService.exe"_s << false << true;
        QTest::newRow("program itself any case") << u"brimvault.EXE"_s << false << true;
        QTest::newRow("piece of uninst.exe") << u"t.exe"_s << false << true;
        QTest::newRow("ends in 000.exe") << u"000.exe"_s << false << true;
        QTest::newRow("UNWISE any case") << u"unwise.exe"_s << false << true;
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
};
BV_REGISTER_TEST(TestGameRules);
#include "tst_gamerules.moc"
