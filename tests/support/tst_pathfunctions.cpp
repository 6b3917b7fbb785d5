#include "support/PathFunctions.h"

#include "TestSuite.h"

using namespace Brimvault;

class tst_PathFunctions : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void paths_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        QTest::newRow("extension, dot in folder") << GetFileExtention(u"C:/a.b/file"_qs, true, true) << u"*.;"_qs;
        QTest::newRow("extension, query cut")
            << GetFileExtention(u"http://h/p.asp?x=a.b"_qs, false, false) << u"asp"_qs;
        QTest::newRow("extension, trailing dot") << GetFileExtention(u"C:\\foo."_qs, false, false) << QString();
        QTest::newRow("name, two dots") << GetFileName(u"C:\\x.tar.gz"_qs, false) << u"x.tar"_qs;
        QTest::newRow("name gains lone dot") << GetFileName(u"C:\\a.b\\file"_qs, true) << u"file."_qs;
        QTest::newRow("name, mixed separators") << GetFileName(u"C:\\a/b\\c/d.exe"_qs, true) << u"d.exe"_qs;
        QTest::newRow("name, trailing slash") << GetFileName(u"C:\\Games\\"_qs, true) << u"."_qs;
        QTest::newRow("name, dot file") << GetFileName(u"C:\\.hidden"_qs, false) << QString();
        QTest::newRow("folder with name") << GetFileFolder(u"C:\\Games\\foo.exe"_qs, true) << u"C:\\Games\\foo"_qs;
        QTest::newRow("folder of bare name") << GetFileFolder(u"game.exe"_qs, true) << u".\\game"_qs;
        QTest::newRow("folder, mixed, slash last") << GetFileFolder(u"C:\\a/b.exe"_qs, false) << u"C:\\a\\"_qs;
        QTest::newRow("folder, root only") << GetFileFolder(u"\\foo.exe"_qs, false) << QString();
        QTest::newRow("folder, query cut") << GetFileFolder(u"http://h/a/p.asp?u=x/y"_qs, true) << u"http://h/a/p"_qs;
        QTest::newRow("slash, backslash style") << AddSlash(u"C:/a\\b"_qs) << u"C:/a\\b\\"_qs;
        QTest::newRow("slash, slash style") << AddSlash(u"C:\\a/b"_qs) << u"C:\\a/b/"_qs;
        QTest::newRow("slash, bare word") << AddSlash(u"dir"_qs) << u".\\dir\\"_qs;
        QTest::newRow("slash, query cut") << AddSlash(u"C:\\a?b\\"_qs) << u"C:\\a\\"_qs;
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
