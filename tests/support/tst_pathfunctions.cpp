#include "support/PathFunctions.h"

#include "TestSuite.h"

#include <QTest>

using namespace Brimvault;

class tst_PathFunctions : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void paths_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const QString exe = u"C:\\Games\\foo.exe"_qs;
        QTest::newRow("extension") << GetFileExtention(exe, false, false) << u"exe"_qs;
        QTest::newRow("extension, last dot") << GetFileExtention(u"x.tar.gz"_qs, false, false) << u"gz"_qs;
        QTest::newRow("extension, dot in folder") << GetFileExtention(u"C:/a.b/file"_qs, true, true) << u"*.;"_qs;
        QTest::newRow("extension, query cut")
            << GetFileExtention(u"http://h/p.asp?x=a.b"_qs, false, false) << u"asp"_qs;
        QTest::newRow("extension, query hides dot")
            << GetFileExtention(u"http://h/p?x.exe"_qs, false, false) << QString();
        QTest::newRow("extension, trailing dot") << GetFileExtention(u"C:\\foo."_qs, false, false) << QString();
        QTest::newRow("extension, dot file") << GetFileExtention(u"C:\\.hidden"_qs, false, false) << u"hidden"_qs;

        QTest::newRow("name") << GetFileName(exe, false) << u"foo"_qs;
        QTest::newRow("name with extension") << GetFileName(exe, true) << u"foo.exe"_qs;
        QTest::newRow("name, two dots") << GetFileName(u"C:\\x.tar.gz"_qs, false) << u"x.tar"_qs;
        QTest::newRow("name, dot in folder") << GetFileName(u"C:\\a.b\\file"_qs, false) << u"file"_qs;
        QTest::newRow("name gains lone dot") << GetFileName(u"C:\\a.b\\file"_qs, true) << u"file."_qs;
        QTest::newRow("name, mixed separators") << GetFileName(u"C:\\a/b\\c/d.exe"_qs, true) << u"d.exe"_qs;
        QTest::newRow("name, query cut") << GetFileName(u"http://h/2007.swf?a=b/c.d"_qs, false) << u"2007"_qs;
        QTest::newRow("name, trailing slash") << GetFileName(u"C:\\Games\\"_qs, true) << u"."_qs;
        QTest::newRow("name, dot file") << GetFileName(u"C:\\.hidden"_qs, false) << QString();

        QTest::newRow("folder") << GetFileFolder(exe, false) << u"C:\\Games\\"_qs;
        QTest::newRow("folder with name") << GetFileFolder(exe, true) << u"C:\\Games\\foo"_qs;
        QTest::newRow("folder of bare name") << GetFileFolder(u"game.exe"_qs, true) << u".\\game"_qs;
        QTest::newRow("folder, mixed, slash last") << GetFileFolder(u"C:\\a/b.exe"_qs, false) << u"C:\\a\\"_qs;
        QTest::newRow("folder, drive root") << GetFileFolder(u"C:\\foo.exe"_qs, false) << u".\\C:\\"_qs;
        QTest::newRow("folder, root only") << GetFileFolder(u"\\foo.exe"_qs, false) << QString();
        QTest::newRow("folder, query cut") << GetFileFolder(u"http://h/a/p.asp?u=x/y"_qs, true) << u"http://h/a/p"_qs;
        QTest::newRow("folder of nothing") << GetFileFolder(QString(), false) << u".\\"_qs;

        QTest::newRow("slash, empty") << AddSlash(QString()) << QString();
        QTest::newRow("slash, backslash style") << AddSlash(u"C:/a\\b"_qs) << u"C:/a\\b\\"_qs;
        QTest::newRow("slash, slash style") << AddSlash(u"C:\\a/b"_qs) << u"C:\\a/b/"_qs;
        QTest::newRow("slash, bare word") << AddSlash(u"dir"_qs) << u".\\dir\\"_qs;
        QTest::newRow("slash, query cut") << AddSlash(u"C:\\a?b\\"_qs) << u"C:\\a\\"_qs;
        QTest::newRow("slash, only a query") << AddSlash(u"?x"_qs) << QString();
    }
    void paths()
    {
        QFETCH(QString, actual);
        QFETCH(QString, expected);
        QCOMPARE(actual, expected);
    }
};

BV_REGISTER_TEST(tst_PathFunctions);
#include "tst_pathfunctions.moc"
