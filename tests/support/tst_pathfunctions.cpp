#include "support/PathFunctions.h"

#include <QTest>

using namespace Brimvault;

class tst_PathFunctions : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void extension_data();
    void extension();
    void fileName_data();
    void fileName();
    void fileFolder_data();
    void fileFolder();
    void addSlash_data();
    void addSlash();
};

void tst_PathFunctions::extension_data()
{
    QTest::addColumn<QString>("path");
    QTest::addColumn<bool>("withWildcard");
    QTest::addColumn<bool>("withSemicolon");
    QTest::addColumn<QString>("expected");

    QTest::newRow("plain") << u"C:\\Games\\foo.exe"_qs << false << false << u"exe"_qs;
    QTest::newRow("wildcard") << u"C:\\Games\\foo.exe"_qs << true << false << u"*.exe"_qs;
    QTest::newRow("semicolon") << u"C:\\Games\\foo.exe"_qs << false << true << u"exe;"_qs;
    QTest::newRow("both") << u"C:\\Games\\foo.exe"_qs << true << true << u"*.exe;"_qs;
    QTest::newRow("case kept") << u"C:\\PAGE.HTM"_qs << false << false << u"HTM"_qs;
    QTest::newRow("last dot wins") << u"C:\\a\\x.tar.gz"_qs << false << false << u"gz"_qs;
    QTest::newRow("dot in folder only") << u"C:\\a.b\\file"_qs << false << false << QString();
    QTest::newRow("dot in folder, wildcard") << u"C:\\a.b\\file"_qs << true << true << u"*.;"_qs;
    QTest::newRow("no dot") << u"C:\\Games\\foo"_qs << false << false << QString();
    QTest::newRow("bare name") << u"game.exe"_qs << false << false << u"exe"_qs;
    QTest::newRow("forward slashes") << u"C:/a.b/file"_qs << false << false << QString();
    QTest::newRow("forward slash, ext") << u"/home/u/g.swf"_qs << false << false << u"swf"_qs;
    QTest::newRow("query cut") << u"http://host/page.asp?x=a.b"_qs << false << false << u"asp"_qs;
    QTest::newRow("query hides dot") << u"http://host/page?x.exe"_qs << false << false << QString();
    QTest::newRow("trailing dot") << u"C:\\foo."_qs << false << false << QString();
    QTest::newRow("trailing slash") << u"C:\\dir.d\\"_qs << false << false << QString();
    QTest::newRow("empty") << QString() << false << false << QString();
    QTest::newRow("empty, both") << QString() << true << true << u"*.;"_qs;
    QTest::newRow("dot file") << u"C:\\.hidden"_qs << false << false << u"hidden"_qs;
}

void tst_PathFunctions::extension()
{
    QFETCH(QString, path);
    QFETCH(bool, withWildcard);
    QFETCH(bool, withSemicolon);
    QFETCH(QString, expected);
    QCOMPARE(GetFileExtention(path, withWildcard, withSemicolon), expected);
}

void tst_PathFunctions::fileName_data()
{
    QTest::addColumn<QString>("path");
    QTest::addColumn<bool>("withExtension");
    QTest::addColumn<QString>("expected");

    QTest::newRow("plain") << u"C:\\Games\\Foo\\foo.exe"_qs << false << u"foo"_qs;
    QTest::newRow("with extension") << u"C:\\Games\\Foo\\foo.exe"_qs << true << u"foo.exe"_qs;
    QTest::newRow("two dots") << u"C:\\x.tar.gz"_qs << false << u"x.tar"_qs;
    QTest::newRow("dot in folder") << u"C:\\a.b\\file"_qs << false << u"file"_qs;
    QTest::newRow("dot in folder gains lone dot") << u"C:\\a.b\\file"_qs << true << u"file."_qs;
    QTest::newRow("no dot, no slash") << u"readme"_qs << false << u"readme"_qs;
    QTest::newRow("no dot, no slash, with extension") << u"readme"_qs << true << u"readme."_qs;
    QTest::newRow("bare name") << u"game.exe"_qs << false << u"game"_qs;
    QTest::newRow("forward slashes") << u"/home/u/games/g.swf"_qs << false << u"g"_qs;
    QTest::newRow("mixed separators") << u"C:\\a/b\\c/d.exe"_qs << true << u"d.exe"_qs;
    QTest::newRow("query cut") << u"http://host/20071231.swf?a=b/c.d"_qs << false << u"20071231"_qs;
    QTest::newRow("trailing slash") << u"C:\\Games\\"_qs << false << QString();
    QTest::newRow("trailing slash, with extension") << u"C:\\Games\\"_qs << true << u"."_qs;
    QTest::newRow("empty") << QString() << false << QString();
    QTest::newRow("empty, with extension") << QString() << true << u"."_qs;
    QTest::newRow("dot file") << u"C:\\.hidden"_qs << false << QString();
    QTest::newRow("trailing dot") << u"C:\\foo."_qs << true << u"foo."_qs;
    QTest::newRow("blanks kept") << u"C:\\My Games\\My Game.exe"_qs << false << u"My Game"_qs;
}

void tst_PathFunctions::fileName()
{
    QFETCH(QString, path);
    QFETCH(bool, withExtension);
    QFETCH(QString, expected);
    QCOMPARE(GetFileName(path, withExtension), expected);
}

void tst_PathFunctions::fileFolder_data()
{
    QTest::addColumn<QString>("path");
    QTest::addColumn<bool>("withName");
    QTest::addColumn<QString>("expected");

    QTest::newRow("plain") << u"C:\\Games\\Foo\\foo.exe"_qs << false << u"C:\\Games\\Foo\\"_qs;
    QTest::newRow("with name") << u"C:\\Games\\Foo\\foo.exe"_qs << true << u"C:\\Games\\Foo\\foo"_qs;
    QTest::newRow("bare name") << u"game.exe"_qs << false << u".\\"_qs;
    QTest::newRow("bare name, with name") << u"game.exe"_qs << true << u".\\game"_qs;
    // No "/" replacement here: the folder's own separators decide what AddSlash appends.
    QTest::newRow("forward slashes") << u"/home/u/g.swf"_qs << false << u"/home/u/"_qs;
    QTest::newRow("mixed, slash last") << u"C:\\a/b.exe"_qs << false << u"C:\\a\\"_qs;
    QTest::newRow("mixed, backslash last") << u"C:/a\\b.exe"_qs << false << u"C:/a/"_qs;
    QTest::newRow("mixed, deeper") << u"C:/x\\a/b.exe"_qs << false << u"C:/x\\a\\"_qs;
    // The drive alone holds no separator, so AddSlash treats it as a bare word.
    QTest::newRow("drive root") << u"C:\\foo.exe"_qs << false << u".\\C:\\"_qs;
    QTest::newRow("root only") << u"\\foo.exe"_qs << false << QString();
    QTest::newRow("trailing slash") << u"C:\\Games\\"_qs << false << u"C:\\Games\\"_qs;
    QTest::newRow("query cut") << u"http://host/a/page.asp?u=x/y"_qs << false << u"http://host/a/"_qs;
    QTest::newRow("query cut, with name") << u"http://host/a/page.asp?u=x/y"_qs << true << u"http://host/a/page"_qs;
    QTest::newRow("empty") << QString() << false << u".\\"_qs;
    QTest::newRow("dot in folder") << u"C:\\a.b\\file"_qs << true << u"C:\\a.b\\file"_qs;
}

void tst_PathFunctions::fileFolder()
{
    QFETCH(QString, path);
    QFETCH(bool, withName);
    QFETCH(QString, expected);
    QCOMPARE(GetFileFolder(path, withName), expected);
}

void tst_PathFunctions::addSlash_data()
{
    QTest::addColumn<QString>("path");
    QTest::addColumn<QString>("expected");

    QTest::newRow("empty") << QString() << QString();
    QTest::newRow("ends with backslash") << u"C:\\Games\\"_qs << u"C:\\Games\\"_qs;
    QTest::newRow("ends with slash") << u"/home/u/"_qs << u"/home/u/"_qs;
    QTest::newRow("backslash style") << u"C:\\Games"_qs << u"C:\\Games\\"_qs;
    QTest::newRow("slash style") << u"/home/u"_qs << u"/home/u/"_qs;
    QTest::newRow("mixed, backslash last") << u"C:/a\\b"_qs << u"C:/a\\b\\"_qs;
    QTest::newRow("mixed, slash last") << u"C:\\a/b"_qs << u"C:\\a/b/"_qs;
    QTest::newRow("bare word") << u"dir"_qs << u".\\dir\\"_qs;
    QTest::newRow("drive only") << u"C:"_qs << u".\\C:\\"_qs;
    QTest::newRow("query cut") << u"C:\\a?b\\"_qs << u"C:\\a\\"_qs;
    QTest::newRow("only a query") << u"?x"_qs << QString();
}

void tst_PathFunctions::addSlash()
{
    QFETCH(QString, path);
    QFETCH(QString, expected);
    QCOMPARE(AddSlash(path), expected);
}

QTEST_APPLESS_MAIN(tst_PathFunctions)
#include "tst_pathfunctions.moc"
