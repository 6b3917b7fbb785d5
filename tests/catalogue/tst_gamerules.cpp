#include "catalogue/GameFileRules.h"
#include "catalogue/GameNames.h"
#include "catalogue/IconCacheKey.h"

#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;

class TestGameRules : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void tidyName_data();
    void tidyName();
    void builtInName_data();
    void builtInName();
    void iconCacheKey_data();
    void iconCacheKey();
    void sameNameInOtherFolders();
    void discoverable_data();
    void discoverable();
    void folderScanExtension_data();
    void folderScanExtension();

private:
    TestEnvironment m_env;
};

void TestGameRules::initTestCase()
{
    QVERIFY(QDir(m_env.root()).exists());
}

void TestGameRules::tidyName_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<QString>("expected");
    QTest::newRow("russian prefix cut") << QStringLiteral("Исполняемый файл для игры Chess") << QStringLiteral("Chess");
    QTest::newRow("prefix elsewhere kept")
        << QStringLiteral("A Исполняемый файл для игры") << QStringLiteral("A Исполняемый файл для игры");
    QTest::newRow("prefix without blank kept")
        << QStringLiteral("Исполняемый файл для игры") << QStringLiteral("Исполняемый файл для игры");
    QTest::newRow("40 without blanks") << QStringLiteral("ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmn")
                                       << QStringLiteral("ABCDEFGHIJKL MNOPQRSTUVWX YZabcd...");
    QTest::newRow("exactly 12 unbroken") << QStringLiteral("ABCDEFGHIJKL") << QStringLiteral("ABCDEFGHIJKL");
    QTest::newRow("13 broken after 12") << QStringLiteral("ABCDEFGHIJKLM") << QStringLiteral("ABCDEFGHIJKL M");
    QTest::newRow("24 letters, 25 after break, stays")
        << QStringLiteral("ABCDEFGHIJKLMNOPQRSTUVWX") << QStringLiteral("ABCDEFGHIJKL MNOPQRSTUVWX");
    QTest::newRow("25 letters get a second blank after the 25th character")
        << QStringLiteral("ABCDEFGHIJKLMNOPQRSTUVWXY") << QStringLiteral("ABCDEFGHIJKL MNOPQRSTUVWX Y");
    QTest::newRow("26 letters get a second blank after the 25th character")
        << QStringLiteral("ABCDEFGHIJKLMNOPQRSTUVWXYZ") << QStringLiteral("ABCDEFGHIJKL MNOPQRSTUVWX YZ");
    QTest::newRow("27 with blanks unbroken")
        << QStringLiteral("Solitaire Collection Deluxe") << QStringLiteral("Solitaire Collection Deluxe");
    QTest::newRow("exactly 30 kept") << QStringLiteral("Thirty characters long name ok")
                                     << QStringLiteral("Thirty characters long name ok");
    QTest::newRow("31 cut") << QStringLiteral("Thirty-one characters long name")
                            << QStringLiteral("Thirty-one characters long nam...");
    QTest::newRow("prefix then cut") << QStringLiteral("Исполняемый файл для игры ") + QString(31, u'x')
                                     << QStringLiteral("xxxxxxxxxxxx xxxxxxxxxxxx xxxxxx...");
    QTest::newRow("empty") << QString() << QString();
}

void TestGameRules::tidyName()
{
    QFETCH(QString, name);
    QFETCH(QString, expected);
    QCOMPARE(GameNames::TidyName(name), expected);
}

void TestGameRules::builtInName_data()
{
    QTest::addColumn<QString>("title");
    QTest::addColumn<QString>("expected");
    QTest::newRow("zone hearts") << QStringLiteral("hrtzzm") << QStringLiteral("Internet Chervi");
    QTest::newRow("zone any case") << QStringLiteral("RVSEZM") << QStringLiteral("Internet Reversi");
    QTest::newRow("zone backgammon") << QStringLiteral("bckgzm") << QStringLiteral("Internet Nardi");
    QTest::newRow("member without row") << QStringLiteral("zm") << QString();
    QTest::newRow("publisher game, built-in language") << QStringLiteral("sudoku") << QString();
    QTest::newRow("other title") << QStringLiteral("doom") << QString();
}

void TestGameRules::builtInName()
{
    QFETCH(QString, title);
    QFETCH(QString, expected);
    QCOMPARE(GameNames::BuiltInName(title), expected);
}

void TestGameRules::iconCacheKey_data()
{
    QTest::addColumn<QString>("path");
    QTest::addColumn<QString>("expected");
    QTest::newRow("worked example") << QStringLiteral("C:\\G.exe") << QStringLiteral("G325331");
    // Odd positions C \ . x = 67+92+46+120, even : G e e with "g" 103 instead of 71.
    QTest::newRow("sums use the path as given") << QStringLiteral("C:\\g.exe") << QStringLiteral("G325363");
    QTest::newRow("unix path") << QStringLiteral("/a/b.exe") << QStringLiteral("B260397");
    QTest::newRow("no extension") << QStringLiteral("ab") << QStringLiteral("AB9798");
    QTest::newRow("eight-bit code") << QStringLiteral("é") << QStringLiteral("É2330");
    QTest::newRow("outside the code page") << QStringLiteral("ж") << QStringLiteral("Ж630");
    QTest::newRow("empty") << QString() << QStringLiteral("00");
}

void TestGameRules::iconCacheKey()
{
    QFETCH(QString, path);
    QFETCH(QString, expected);
    QCOMPARE(IconCacheKey(path), expected);
    QCOMPARE(IconCacheFile(QStringLiteral("/c/Icons/"), path), QStringLiteral("/c/Icons/") + expected + u".ico");
}

void TestGameRules::sameNameInOtherFolders()
{
    const QString first = IconCacheKey(QStringLiteral("C:\\Games\\One\\game.exe"));
    const QString second = IconCacheKey(QStringLiteral("C:\\Games\\Two\\game.exe"));
    QVERIFY(first.startsWith(QStringLiteral("GAME")));
    QVERIFY(second.startsWith(QStringLiteral("GAME")));
    QVERIFY(first != second);
    QVERIFY(IconCacheFile(QString(), QStringLiteral("C:\\G.exe")).isEmpty());
}

void TestGameRules::discoverable_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<bool>("discoverable");
    QTest::newRow("game") << QStringLiteral("game.exe") << true;
    QTest::newRow("upper-case extension") << QStringLiteral("GAME.EXE") << true;
    QTest::newRow("not an executable") << QStringLiteral("game.txt") << false;
    QTest::newRow("extension inside name") << QStringLiteral("game.exe.txt") << false;
    QTest::newRow("service") << QStringLiteral("BrimvaultService.exe") << false;
    QTest::newRow("program itself any case") << QStringLiteral("brimvault.EXE") << false;
    QTest::newRow("piece of uninst.exe") << QStringLiteral("t.exe") << false;
    QTest::newRow("ends in 000.exe") << QStringLiteral("000.exe") << false;
    QTest::newRow("UNWISE any case") << QStringLiteral("unwise.exe") << false;
    QTest::newRow("setup any case") << QStringLiteral("GameSETUP.exe") << false;
    QTest::newRow("installer") << QStringLiteral("Install.exe") << false;
    QTest::newRow("uninstaller of another kind") << QStringLiteral("uninstall.exe") << false;
    QTest::newRow("similar but longer") << QStringLiteral("xuninst.exe") << true;
}

void TestGameRules::discoverable()
{
    QFETCH(QString, name);
    QFETCH(bool, discoverable);
    QCOMPARE(GameFileRules::IsDiscoverableExecutable(name), discoverable);
}

void TestGameRules::folderScanExtension_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<bool>("accepted");
    QTest::newRow("exe") << QStringLiteral("a.exe") << true;
    QTest::newRow("swf upper") << QStringLiteral("a.SWF") << true;
    QTest::newRow("text") << QStringLiteral("readme.txt") << false;
    QTest::newRow("no extension") << QStringLiteral("exe") << false;
    QTest::newRow("partial extension") << QStringLiteral("a.ex") << false;
    QTest::newRow("dot in folder only") << QStringLiteral("dir.exe\\file") << false;
}

void TestGameRules::folderScanExtension()
{
    QFETCH(QString, name);
    QFETCH(bool, accepted);
    QCOMPARE(GameFileRules::HasAcceptedExtension(name), accepted);
}

QTEST_GUILESS_MAIN(TestGameRules)
#include "tst_gamerules.moc"
