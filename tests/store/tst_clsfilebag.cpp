#include "store/SettingsStore.h"
#include "store/clsFileBag.h"

#include "TestEnvironment.h"

#include <QDir>
#include <QFile>
#include <QtTest>

#ifdef Q_OS_UNIX
#include <sys/stat.h>
#endif

using namespace Brimvault;

class TestClsFileBag : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void makeKey_data();
    void makeKey();
    void makeKeyFromArguments();
    void getField_data();
    void getField();
    void valueEscapes_data();
    void valueEscapes();
    void unescapeOfStoredText_data();
    void unescapeOfStoredText();
    void getValueFromRecord_data();
    void getValueFromRecord();
    void lookup_data();
    void lookup();
    void setRecord_data();
    void setRecord();
    void removeRecord_data();
    void removeRecord();
    void oddKeysTerminate_data();
    void oddKeysTerminate();
    void getAll_data();
    void getAll();
    void recordCount_data();
    void recordCount();
    void leftTo_data();
    void leftTo();
    void changedFlag();
    void settingParts();

    void openFile_data();
    void openFile();
    void openFileMissingOrEmptyName();
    void notAPlainFile_data();
    void notAPlainFile();
    void hugeLine();
    void oversizedFileIsLeftAlone();
    void saveWritesTextExactly();
    void saveEmptyTextDeletesFile();
    void saveCreatesOneMissingFolder_data();
    void saveCreatesOneMissingFolder();
    void saveWithoutFileName();
    void registryRoundTrip();
};

static QString bs(const char* latin1)
{
    return QString::fromLatin1(latin1);
}

void TestClsFileBag::makeKey_data()
{
    QTest::addColumn<QVariantList>("parts");
    QTest::addColumn<QString>("key");
    QTest::newRow("two parts") << QVariantList {u"ads"_qs, u"URL"_qs} << u"<>ads<>>URL<"_qs;
    QTest::newRow("empty middle part") << QVariantList {u"a"_qs, QString(), u"c"_qs} << u"<>a<>>>c<"_qs;
    QTest::newRow("empty first part") << QVariantList {QString(), u"b"_qs} << u"<>>b<"_qs;
    QTest::newRow("no parts") << QVariantList {} << u"<"_qs;
    QTest::newRow("only empty parts") << QVariantList {QString(), QString()} << u"<"_qs;
    QTest::newRow("escaped less-than") << QVariantList {u"a<b"_qs} << bs("<>a\\{[}\\b<");
    QTest::newRow("all escapes") << QVariantList {u"x>y\r\nz"_qs} << bs("<>x\\{]}\\y\\{NL}\\z<");
    QTest::newRow("numbers and flags") << QVariantList {3, true} << u"<>3<>>True<"_qs;
    QTest::newRow("lone CR stays raw") << QVariantList {u"a\rb"_qs} << u"<>a\rb<"_qs;
}

void TestClsFileBag::makeKey()
{
    QFETCH(QVariantList, parts);
    QFETCH(QString, key);
    QCOMPARE(clsFileBag::MakeKey(parts), key);
}

void TestClsFileBag::makeKeyFromArguments()
{
    QCOMPARE(clsFileBag::MakeKey(u"ads"_qs, u"URL"_qs), u"<>ads<>>URL<"_qs);
    QCOMPARE(clsFileBag::MakeKey(u"a"_qs, QString(), u"c"_qs, 4), u"<>a<>>>c<>>>>4<"_qs);
    QCOMPARE(clsFileBag::MakeKey(), u"<"_qs);
}

void TestClsFileBag::getField_data()
{
    QTest::addColumn<QString>("key");
    QTest::addColumn<int>("field");
    QTest::addColumn<QString>("expected");
    const QString adsUrl = clsFileBag::MakeKey(u"ads"_qs, u"URL"_qs);
    QTest::newRow("field 0 is empty") << adsUrl << 0 << QString();
    QTest::newRow("first") << adsUrl << 1 << u"ads"_qs;
    QTest::newRow("second") << adsUrl << 2 << u"URL"_qs;
    QTest::newRow("after closing") << adsUrl << 3 << QString();
    QTest::newRow("beyond") << adsUrl << 40 << QString();
    QTest::newRow("negative") << adsUrl << -1 << QString();
    QTest::newRow("shift after empty part") << clsFileBag::MakeKey(QString(), u"b"_qs) << 1 << u"b"_qs;
    QTest::newRow("shifted away") << clsFileBag::MakeKey(QString(), u"b"_qs) << 2 << QString();
    QTest::newRow("unescaped") << clsFileBag::MakeKey(u"a<b>\r\n"_qs) << 1 << u"a<b>\r\n"_qs;
    QTest::newRow("empty key") << QString() << 0 << QString();
}

void TestClsFileBag::getField()
{
    QFETCH(QString, key);
    QFETCH(int, field);
    QFETCH(QString, expected);
    QCOMPARE(clsFileBag::GetField(key, qint16(field)), expected);
}

void TestClsFileBag::valueEscapes_data()
{
    QTest::addColumn<QString>("value");
    QTest::addColumn<QString>("stored");
    QTest::addColumn<QString>("readBack");
    QTest::newRow("less-than") << u"<"_qs << bs("\\{[}\\") << u"<"_qs;
    QTest::newRow("greater-than") << u">"_qs << bs("\\{]}\\") << u">"_qs;
    QTest::newRow("CR LF") << u"\r\n"_qs << bs("\\{NL}\\") << u"\r\n"_qs;
    QTest::newRow("mixed") << u"a<b>c\r\nd"_qs << bs("a\\{[}\\b\\{]}\\c\\{NL}\\d") << u"a<b>c\r\nd"_qs;
    QTest::newRow("lone CR") << u"a\rb"_qs << u"a\rb"_qs << u"a\rb"_qs;
    QTest::newRow("lone LF") << u"a\nb"_qs << u"a\nb"_qs << u"a\nb"_qs;
    QTest::newRow("LF CR is no pair") << u"\n\r"_qs << u"\n\r"_qs << u"\n\r"_qs;
    QTest::newRow("CR before pair") << u"\r\r\n"_qs << bs("\r\\{NL}\\") << u"\r\r\n"_qs;
    QTest::newRow("backslash") << bs("C:\\x\\") << bs("C:\\x\\") << bs("C:\\x\\");
    QTest::newRow("escape text itself") << bs("\\{NL}\\") << bs("\\{NL}\\") << u"\r\n"_qs;
}

// A value goes into the text escaped and comes back unescaped.
void TestClsFileBag::valueEscapes()
{
    QFETCH(QString, value);
    QFETCH(QString, stored);
    QFETCH(QString, readBack);
    clsFileBag bag;
    const QString key = clsFileBag::MakeKey(u"k"_qs);
    bag.SetRecord(key, value);
    QCOMPARE(bag.CurrentFileText(), key + stored);
    QCOMPARE(bag.GetValue(key), readBack);
}

void TestClsFileBag::unescapeOfStoredText_data()
{
    QTest::addColumn<QString>("stored");
    QTest::addColumn<QString>("value");
    QTest::newRow("lower case NL") << bs("a\\{nl}\\b") << u"a\r\nb"_qs;
    QTest::newRow("mixed case NL") << bs("\\{Nl}\\") << u"\r\n"_qs;
    QTest::newRow("brackets") << bs("\\{[}\\x\\{]}\\") << u"<x>"_qs;
    // The backslash between the two sequences is shared: "<" is replaced first and takes it.
    QTest::newRow("less-than before greater-than") << bs("\\{[}\\{]}\\") << bs("<{]}\\");
    QTest::newRow("NL last") << bs("\\{]\\{NL}\\}\\") << bs("\\{]\r\n}\\");
    QTest::newRow("incomplete") << bs("\\{NL}") << bs("\\{NL}");
}

void TestClsFileBag::unescapeOfStoredText()
{
    QFETCH(QString, stored);
    QFETCH(QString, value);
    clsFileBag bag;
    bag.SetCurrentFileText(u"<>k<"_qs + stored);
    QCOMPARE(bag.GetValue(clsFileBag::MakeKey(u"k"_qs)), value);
}

void TestClsFileBag::getValueFromRecord_data()
{
    QTest::addColumn<QString>("record");
    QTest::addColumn<QString>("expected");
    QTest::newRow("value") << u"<>a<value"_qs << u"value"_qs;
    QTest::newRow("empty value") << u"<>a<"_qs << u"dflt"_qs;
    QTest::newRow("empty record") << QString() << u"dflt"_qs;
    QTest::newRow("no key") << u"plain"_qs << u"plain"_qs;
    QTest::newRow("last piece") << u"<>a<x<y"_qs << u"y"_qs;
    QTest::newRow("escaped") << bs("<>a<1\\{NL}\\2") << u"1\r\n2"_qs;
}

void TestClsFileBag::getValueFromRecord()
{
    QFETCH(QString, record);
    QFETCH(QString, expected);
    QCOMPARE(clsFileBag::GetValueFromRecord(record, u"dflt"_qs), expected);
}

void TestClsFileBag::lookup_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("key");
    QTest::addColumn<QString>("record");
    QTest::addColumn<QString>("value");
    const QString a = clsFileBag::MakeKey(u"a"_qs);
    QTest::newRow("case-insensitive") << u"<>Ads<v"_qs << clsFileBag::MakeKey(u"ADS"_qs) << u"<>Ads<v"_qs << u"v"_qs;
    QTest::newRow("middle line") << u"<>b<1\r\n<>a<2\r\n<>c<3"_qs << a << u"<>a<2"_qs << u"2"_qs;
    QTest::newRow("prefix of a longer key first") << u"<>a<>>x<1\r\n<>a<2"_qs << a << u"<>a<>>x<1"_qs << u"1"_qs;
    QTest::newRow("anywhere in a line") << u"junk<>a<v"_qs << a << u"junk<>a<v"_qs << u"v"_qs;
    QTest::newRow("empty value") << u"<>a<"_qs << a << u"<>a<"_qs << u"dflt"_qs;
    QTest::newRow("missing") << u"<>b<1"_qs << a << QString() << u"dflt"_qs;
    QTest::newRow("empty text") << QString() << a << QString() << u"dflt"_qs;
    QTest::newRow("final line end") << u"<>a<x\r\n"_qs << a << u"<>a<x"_qs << u"x"_qs;
    QTest::newRow("lone LF joins lines") << u"<>a<1\n<>b<2"_qs << a << u"<>a<1\n<>b<2"_qs << u"2"_qs;
    QTest::newRow("lone CR joins lines") << u"<>b<2\r<>a<1"_qs << a << u"<>b<2\r<>a<1"_qs << u"1"_qs;
    QTest::newRow("two parts") << u"<>ads<>>URL<http://x/"_qs << clsFileBag::MakeKey(u"ads"_qs, u"url"_qs)
                               << u"<>ads<>>URL<http://x/"_qs << u"http://x/"_qs;
}

void TestClsFileBag::lookup()
{
    QFETCH(QString, text);
    QFETCH(QString, key);
    QFETCH(QString, record);
    QFETCH(QString, value);
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    QCOMPARE(bag.GetRecord(key), record);
    QCOMPARE(bag.GetValue(key, u"dflt"_qs), value);
    QVERIFY(!bag.Changed());
}

void TestClsFileBag::setRecord_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("key");
    QTest::addColumn<QString>("value");
    QTest::addColumn<QString>("expected");
    QTest::newRow("empty bag") << QString() << u"<>a<"_qs << u"1"_qs << u"<>a<1"_qs;
    QTest::newRow("second record") << u"<>a<1"_qs << u"<>b<"_qs << u"2"_qs << u"<>a<1\r\n<>b<2"_qs;
    QTest::newRow("after final line end") << u"<>a<1\r\n"_qs << u"<>b<"_qs << u"2"_qs << u"<>a<1\r\n<>b<2"_qs;
    QTest::newRow("replace keeps place") << u"<>a<1\r\n<>b<2\r\n<>c<3"_qs << u"<>B<"_qs << u"x"_qs
                                         << u"<>a<1\r\n<>B<x\r\n<>c<3"_qs;
    QTest::newRow("replace last line") << u"<>a<1\r\n<>b<2"_qs << u"<>b<"_qs << QString() << u"<>a<1\r\n<>b<"_qs;
    QTest::newRow("replace whole line of prefix match") << u"<>a<>>x<1"_qs << u"<>a<"_qs << u"2"_qs << u"<>a<2"_qs;
    QTest::newRow("one character text") << u"x"_qs << u"<>a<"_qs << u"1"_qs << u"x<>a<1"_qs;
    QTest::newRow("two character text") << u"xy"_qs << u"<>a<"_qs << u"1"_qs << u"xy<>a<1"_qs;
    QTest::newRow("bare line end") << u"\r\n"_qs << u"<>a<"_qs << u"1"_qs << u"\r\n<>a<1"_qs;
    QTest::newRow("three character text") << u"xyz"_qs << u"<>a<"_qs << u"1"_qs << u"xyz\r\n<>a<1"_qs;
    QTest::newRow("value escaped") << QString() << u"<>a<"_qs << u"p<q\r\nr"_qs << bs("<>a<p\\{[}\\q\\{NL}\\r");
    QTest::newRow("lone LF line replaced whole") << u"<>a<1\n<>b<2"_qs << u"<>b<"_qs << u"3"_qs << u"<>b<3"_qs;
}

void TestClsFileBag::setRecord()
{
    QFETCH(QString, text);
    QFETCH(QString, key);
    QFETCH(QString, value);
    QFETCH(QString, expected);
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    QVERIFY(!bag.Changed());
    bag.SetRecord(key, value);
    QCOMPARE(bag.CurrentFileText(), expected);
    QVERIFY(bag.Changed());
}

void TestClsFileBag::removeRecord_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("key");
    QTest::addColumn<bool>("removeAll");
    QTest::addColumn<QString>("expected");
    QTest::addColumn<bool>("removed");
    const QString three = u"<>a<1\r\n<>b<2\r\n<>A<3"_qs;
    QTest::newRow("first only") << three << u"<>a<"_qs << false << u"<>b<2\r\n<>A<3"_qs << true;
    QTest::newRow("all, last line keeps the line end before it")
        << three << u"<>a<"_qs << true << u"<>b<2\r\n"_qs << true;
    QTest::newRow("middle") << three << u"<>b<"_qs << false << u"<>a<1\r\n<>A<3"_qs << true;
    QTest::newRow("last") << u"<>a<1\r\n<>b<2"_qs << u"<>b<"_qs << false << u"<>a<1\r\n"_qs << true;
    QTest::newRow("missing") << u"<>a<1"_qs << u"<>b<"_qs << true << u"<>a<1"_qs << false;
    QTest::newRow("every line") << u"<>a<1\r\n<>a<2\r\n<>a<3"_qs << u"<>a<"_qs << true << QString() << true;
    QTest::newRow("prefix matches") << u"<>a<>>x<1\r\n<>b<2"_qs << u"<>a<"_qs << true << u"<>b<2"_qs << true;
    QTest::newRow("adjacent matches") << u"<>b<0\r\n<>a<1\r\n<>a<2\r\n<>b<3"_qs << u"<>a<"_qs << true
                                      << u"<>b<0\r\n<>b<3"_qs << true;
    QTest::newRow("empty text") << QString() << u"<>a<"_qs << true << QString() << false;
}

void TestClsFileBag::removeRecord()
{
    QFETCH(QString, text);
    QFETCH(QString, key);
    QFETCH(bool, removeAll);
    QFETCH(QString, expected);
    QFETCH(bool, removed);
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    QCOMPARE(bag.RemoveRecord(key, removeAll), removed);
    QCOMPARE(bag.CurrentFileText(), expected);
    QCOMPARE(bag.Changed(), removed);
}

void TestClsFileBag::oddKeysTerminate_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("key");
    QTest::newRow("empty key") << u"x\r\ny\r\n"_qs << QString();
    QTest::newRow("line end as key") << u"a\r\n\r\nb"_qs << u"\r\n"_qs;
    QTest::newRow("LF as key") << u"a\r\n"_qs << u"\n"_qs;
    QTest::newRow("key across lines") << u"<>a<1\r\n<>b<2"_qs << u"1\r\n<"_qs;
}

// Keys that MakeKey never builds still give an answer and never loop.
void TestClsFileBag::oddKeysTerminate()
{
    QFETCH(QString, text);
    QFETCH(QString, key);
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    const QStringList lines = bag.GetAll(key, 2);
    QVERIFY(lines.size() <= text.size() + 1);
    QCOMPARE(lines.last(), QString());
    bag.RemoveRecord(key, true);
    QVERIFY(bag.CurrentFileText().size() <= text.size());
    bag.SetCurrentFileText(text);
    bag.SetRecord(key, u"v"_qs);
    QVERIFY(bag.CurrentFileText().contains(key + u"v"_qs));
}

void TestClsFileBag::getAll_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("key");
    QTest::addColumn<int>("mode");
    QTest::addColumn<QStringList>("expected");
    const QString text = bs("<>a<>>x<1\r\n<>b<2\r\n<>A<>>y<3\\{[}\\");
    const QString a = clsFileBag::MakeKey(u"a"_qs);
    QTest::newRow("keys") << text << a << 0 << QStringList {u"<>a<>>x<"_qs, u"<>A<>>y<"_qs, QString()};
    QTest::newRow("values") << text << a << 1 << QStringList {u"1"_qs, u"3<"_qs, QString()};
    QTest::newRow("lines") << text << a << 2 << QStringList {u"<>a<>>x<1"_qs, bs("<>A<>>y<3\\{[}\\"), QString()};
    QTest::newRow("other mode") << text << a << 7 << QStringList {QString(), QString(), QString()};
    QTest::newRow("no match") << text << clsFileBag::MakeKey(u"z"_qs) << 0 << QStringList {QString()};
    QTest::newRow("empty text") << QString() << a << 2 << QStringList {QString()};
    QTest::newRow("two keys on one line")
        << u"<>a<1<>a<2\r\n<>a<3"_qs << a << 2 << QStringList {u"<>a<1<>a<2"_qs, u"<>a<3"_qs, QString()};
}

void TestClsFileBag::getAll()
{
    QFETCH(QString, text);
    QFETCH(QString, key);
    QFETCH(int, mode);
    QFETCH(QStringList, expected);
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    QCOMPARE(bag.GetAll(key, qint16(mode)), expected);
}

void TestClsFileBag::recordCount_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<int>("count");
    QTest::newRow("empty") << QString() << 0;
    QTest::newRow("one") << u"<>a<1"_qs << 1;
    QTest::newRow("two") << u"<>a<1\r\n<>b<2"_qs << 2;
    QTest::newRow("final line end") << u"<>a<1\r\n<>b<2\r\n"_qs << 2;
    QTest::newRow("two keys one line") << u"<>a<1<>b<2"_qs << 1;
    QTest::newRow("plain lines") << u"plain\r\n<>a<1\r\nplain"_qs << 1;
    QTest::newRow("lone LF") << u"<>a<1\n<>b<2"_qs << 1;
    QTest::newRow("empty lines first") << u"\r\n\r\n<>a<"_qs << 1;
    QTest::newRow("key without value on last line") << u"<>a<1\r\nx\r\n<>c"_qs << 2;
    QTest::newRow("empty key only") << u"<"_qs << 0;
}

void TestClsFileBag::recordCount()
{
    QFETCH(QString, text);
    QFETCH(int, count);
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    QCOMPARE(bag.RecordCount(), count);
}

void TestClsFileBag::leftTo_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("separator");
    QTest::addColumn<int>("compare");
    QTest::addColumn<bool>("fromEnd");
    QTest::addColumn<QString>("expected");
    QTest::newRow("last backslash") << bs("C:\\a\\b.txt") << bs("\\") << 0 << true << bs("C:\\a");
    QTest::newRow("first backslash") << bs("C:\\a\\b.txt") << bs("\\") << 0 << false << u"C:"_qs;
    QTest::newRow("slash is not backslash") << u"/tmp/x"_qs << bs("\\") << 0 << true << u"/tmp/x"_qs;
    QTest::newRow("missing") << u"abc"_qs << u"x"_qs << 0 << false << u"abc"_qs;
    QTest::newRow("exact first") << u"aXbxc"_qs << u"x"_qs << 0 << false << u"aXb"_qs;
    QTest::newRow("text first") << u"aXbxc"_qs << u"x"_qs << 1 << false << u"a"_qs;
    QTest::newRow("text last") << u"axbXc"_qs << u"x"_qs << 1 << true << u"axb"_qs;
    QTest::newRow("exact last") << u"axbXc"_qs << u"x"_qs << 0 << true << u"a"_qs;
    QTest::newRow("empty text") << QString() << u"x"_qs << 0 << false << QString();
    QTest::newRow("empty separator") << u"abc"_qs << QString() << 0 << true << u"abc"_qs;
    QTest::newRow("longer separator") << u"a<>b<>c"_qs << u"<>"_qs << 0 << true << u"a<>b"_qs;
}

void TestClsFileBag::leftTo()
{
    QFETCH(QString, text);
    QFETCH(QString, separator);
    QFETCH(int, compare);
    QFETCH(bool, fromEnd);
    QFETCH(QString, expected);
    QCOMPARE(clsFileBag::LeftTo(text, separator, compare, fromEnd), expected);
}

void TestClsFileBag::changedFlag()
{
    TestEnvironment env;
    clsFileBag bag;
    QVERIFY(!bag.Changed());
    QVERIFY(bag.CurrentFileName().isEmpty());
    QVERIFY(bag.CurrentFileText().isEmpty());
    bag.SetCurrentFileText(u"<>a<1"_qs);
    bag.SetCurrentFileName(env.path(u"x.bvxinf"_qs));
    QVERIFY(!bag.Changed());
    QVERIFY(!bag.RemoveRecord(u"<>b<"_qs, true));
    QVERIFY(!bag.Changed());
    QVERIFY(bag.RemoveRecord(u"<>a<"_qs, false));
    QVERIFY(bag.Changed());
    QVERIFY(bag.OpenFile(QString()));
    QVERIFY(!bag.Changed());
    bag.SetRecord(u"<>a<"_qs, u"1"_qs);
    QVERIFY(bag.Changed());
    bag.SaveRegistry(AppTitle(), u"Bags"_qs, u"Flag"_qs);
    QVERIFY(bag.Changed());
    bag.OpenRegistry(AppTitle(), u"Bags"_qs, u"Flag"_qs);
    QVERIFY(bag.Changed());
    QVERIFY(bag.SaveFile());
    QVERIFY(!bag.Changed());
}

void TestClsFileBag::settingParts()
{
    clsFileBag bag;
    bag.SaveSetting(u"ads"_qs, u"URL"_qs, 2, u"http://a/"_qs);
    bag.SaveSetting(u"ads"_qs, u"URL"_qs, 3, u"<b>"_qs);
    QCOMPARE(bag.CurrentFileText(), bs("<>ads<>>URL<>>>2<http://a/\r\n<>ads<>>URL<>>>3<\\{[}\\b\\{]}\\"));
    QCOMPARE(bag.GetSetting(u"ADS"_qs, u"url"_qs, 3), u"<b>"_qs);
    QCOMPARE(bag.GetSetting(u"ads"_qs, u"URL"_qs, 4, u"none"_qs), u"none"_qs);
    bag.SaveSetting(u"ads"_qs, u"URL"_qs, 2, u"changed"_qs);
    QCOMPARE(bag.RecordCount(), 2);
    QCOMPARE(bag.GetSetting(u"ads"_qs, u"URL"_qs, 2), u"changed"_qs);
}

static void writeBytes(const QString& path, const QByteArray& bytes)
{
    QFile file(path);
    QVERIFY(file.open(QIODevice::WriteOnly));
    QCOMPARE(file.write(bytes), bytes.size());
}

static QByteArray readBytes(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return QByteArray("<unreadable>");
    return file.readAll();
}

void TestClsFileBag::openFile_data()
{
    QTest::addColumn<QByteArray>("bytes");
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("valueOfB");
    QTest::newRow("CR LF") << QByteArray("<>a<1\r\n<>b<2") << u"<>a<1\r\n<>b<2"_qs << u"2"_qs;
    QTest::newRow("final CR LF") << QByteArray("<>a<1\r\n<>b<2\r\n") << u"<>a<1\r\n<>b<2\r\n"_qs << u"2"_qs;
    QTest::newRow("LF only") << QByteArray("<>b<2\n<>a<1\n") << u"<>b<2\n<>a<1\n"_qs << u"1\n"_qs;
    QTest::newRow("lone CR") << QByteArray("<>b<2\r<>c<3") << u"<>b<2\r<>c<3"_qs << u"3"_qs;
    QTest::newRow("UTF-8") << QByteArray("<>b<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0") << u"<>b<Игра"_qs << u"Игра"_qs;
    QTest::newRow("garbage") << QByteArray("\xff\xfe\x00\x01\r\n<>b<\x80x", 12)
                             << QStringLiteral("\uFFFD\uFFFD") + QChar(0) + QChar(1) + u"\r\n<>b<\uFFFDx"_qs
                             << u"\uFFFDx"_qs;
    QTest::newRow("cut multi-byte character at the end")
        << QByteArray("<>b<x\xd0") << u"<>b<x\uFFFD"_qs << u"x\uFFFD"_qs;
    QTest::newRow("empty file") << QByteArray() << QString() << QString();
}

void TestClsFileBag::openFile()
{
    QFETCH(QByteArray, bytes);
    QFETCH(QString, text);
    QFETCH(QString, valueOfB);
    TestEnvironment env;
    const QString path = env.path(u"game.bvxinf"_qs);
    writeBytes(path, bytes);
    clsFileBag bag;
    bag.SetRecord(u"<>old<"_qs, u"x"_qs);
    QVERIFY(bag.OpenFile(path));
    QCOMPARE(bag.CurrentFileName(), path);
    QCOMPARE(bag.CurrentFileText(), text);
    QVERIFY(!bag.Changed());
    QCOMPARE(bag.GetValue(clsFileBag::MakeKey(u"b"_qs)), valueOfB);
}

void TestClsFileBag::openFileMissingOrEmptyName()
{
    TestEnvironment env;
    clsFileBag bag;
    bag.SetRecord(u"<>a<"_qs, u"1"_qs);
    const QString missing = env.path(u"nothing/here.bvxinf"_qs);
    QVERIFY(!bag.OpenFile(missing));
    QCOMPARE(bag.CurrentFileName(), missing);
    QVERIFY(bag.CurrentFileText().isEmpty());
    QVERIFY(!bag.Changed());

    bag.SetRecord(u"<>a<"_qs, u"1"_qs);
    QVERIFY(bag.OpenFile(QString()));
    QVERIFY(bag.CurrentFileName().isEmpty());
    QVERIFY(bag.CurrentFileText().isEmpty());
    QVERIFY(!bag.Changed());
}

void TestClsFileBag::notAPlainFile_data()
{
    QTest::addColumn<QString>("kind");
    QTest::newRow("folder") << u"folder"_qs;
#ifdef Q_OS_UNIX
    QTest::newRow("named pipe") << u"fifo"_qs;
    QTest::newRow("endless device") << u"device"_qs;
#endif
}

// Neither reading nor saving may hang, fill the memory or replace what the bag could not read.
void TestClsFileBag::notAPlainFile()
{
    QFETCH(QString, kind);
    TestEnvironment env;
    QString name = env.path(u"odd.bvxinf"_qs);
    if (kind == u"folder") {
        QVERIFY(QDir().mkpath(name + u"/inside"_qs));
#ifdef Q_OS_UNIX
    } else if (kind == u"fifo") {
        QCOMPARE(::mkfifo(QFile::encodeName(name).constData(), 0600), 0);
    } else {
        name = u"/dev/zero"_qs;
#endif
    }
    clsFileBag bag;
    QVERIFY(!bag.OpenFile(name));
    QVERIFY(bag.CurrentFileText().isEmpty());
    QVERIFY(!bag.SaveFile());
    bag.SetRecord(u"<>a<"_qs, u"1"_qs);
    QVERIFY(!bag.SaveFile());
    QVERIFY(bag.Changed());
    if (kind == u"folder")
        QVERIFY(QFileInfo(name + u"/inside"_qs).isDir());
    else
        QVERIFY(QFileInfo::exists(name));
}

void TestClsFileBag::hugeLine()
{
    TestEnvironment env;
    const QString path = env.path(u"huge.bvxinf"_qs);
    QByteArray bytes(8 * 1024 * 1024, 'x');
    bytes += "<>name<Big\r\n";
    bytes += QByteArray(3 * 1024 * 1024, '<');
    writeBytes(path, bytes);
    clsFileBag bag;
    QVERIFY(bag.OpenFile(path));
    QCOMPARE(bag.CurrentFileText().size(), bytes.size());
    QCOMPARE(bag.GetValue(clsFileBag::MakeKey(u"NAME"_qs)), u"Big"_qs);
    QCOMPARE(bag.RecordCount(), 1);
    QCOMPARE(bag.GetAll(clsFileBag::MakeKey(u"missing"_qs), 1).size(), 1);
}

// A file far beyond any bag is refused, and the refusal protects it from being replaced.
void TestClsFileBag::oversizedFileIsLeftAlone()
{
    TestEnvironment env;
    const QString path = env.path(u"huge.bvxinf"_qs);
    {
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly));
        QVERIFY(file.resize(65 * 1024 * 1024));
    }
    clsFileBag bag;
    QVERIFY(!bag.OpenFile(path));
    QVERIFY(bag.CurrentFileText().isEmpty());
    QVERIFY(!bag.SaveFile());
    QCOMPARE(QFileInfo(path).size(), 65 * 1024 * 1024);
}

void TestClsFileBag::saveWritesTextExactly()
{
    TestEnvironment env;
    const QString path = env.path(u"game.bvxinf"_qs);
    clsFileBag bag;
    QVERIFY(!bag.OpenFile(path));
    bag.SetRecord(clsFileBag::MakeKey(u"Name"_qs), u"Игра"_qs);
    bag.SetRecord(clsFileBag::MakeKey(u"Name_ENG"_qs), u"Game\r\n2"_qs);
    QVERIFY(bag.SaveFile());
    QVERIFY(!bag.Changed());
    QCOMPARE(readBytes(path), QByteArray("<>Name<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0\r\n<>Name_ENG<Game\\{NL}\\2"));

    clsFileBag again;
    QVERIFY(again.OpenFile(path));
    QCOMPARE(again.CurrentFileText(), bag.CurrentFileText());
    QCOMPARE(again.GetValue(clsFileBag::MakeKey(u"name_eng"_qs)), u"Game\r\n2"_qs);
}

void TestClsFileBag::saveEmptyTextDeletesFile()
{
    TestEnvironment env;
    const QString path = env.path(u"game.bvxinf"_qs);
    writeBytes(path, "<>a<1\r\n<>a<2\r\n");
    clsFileBag bag;
    QVERIFY(bag.OpenFile(path));
    QVERIFY(bag.RemoveRecord(clsFileBag::MakeKey(u"a"_qs), true));
    QCOMPARE(bag.CurrentFileText(), QString());
    QVERIFY(bag.SaveFile());
    QVERIFY(!QFile::exists(path));
    // Saving the empty bag again, with no file left, is fine and creates nothing.
    QVERIFY(bag.SaveFile());
    QVERIFY(!QFile::exists(path));
}

void TestClsFileBag::saveCreatesOneMissingFolder_data()
{
    QTest::addColumn<QString>("relative");
    QTest::addColumn<bool>("saved");
    QTest::newRow("slash") << u"/new/game.bvxinf"_qs << true;
    QTest::newRow("backslash") << bs("\\new\\game.bvxinf") << true;
    QTest::newRow("existing folder") << u"/game.bvxinf"_qs << true;
    QTest::newRow("two levels missing") << u"/new/deeper/game.bvxinf"_qs << false;
}

void TestClsFileBag::saveCreatesOneMissingFolder()
{
    QFETCH(QString, relative);
    QFETCH(bool, saved);
    TestEnvironment env;
    const QString name = env.root() + relative;
    clsFileBag bag;
    bag.OpenFile(name);
    bag.SetRecord(u"<>a<"_qs, u"1"_qs);
    QCOMPARE(bag.SaveFile(), saved);
    QCOMPARE(bag.Changed(), !saved);
    QString onDisk = name;
    onDisk.replace(u'\\', u'/');
    QCOMPARE(readBytes(onDisk), saved ? QByteArray("<>a<1") : QByteArray("<unreadable>"));
}

void TestClsFileBag::saveWithoutFileName()
{
    TestEnvironment env;
    clsFileBag bag;
    bag.SetRecord(u"<>a<"_qs, u"1"_qs);
    QVERIFY(bag.SaveFile());
    QVERIFY(!bag.Changed());
    QCOMPARE(QDir(env.root()).entryList(QDir::Files).size(), 0);
}

void TestClsFileBag::registryRoundTrip()
{
    TestEnvironment env;
    clsFileBag bag;
    bag.SetCurrentFileName(u"kept.bvxinf"_qs);
    bag.SetRecord(clsFileBag::MakeKey(u"ads"_qs, u"URL"_qs), u"http://a/?x=1&y=[2]"_qs);
    bag.SetRecord(clsFileBag::MakeKey(u"ads"_qs, u"Text"_qs), u"line 1\r\nline 2\\n"_qs);
    bag.SetCurrentFileText(bag.CurrentFileText() + u"\r\n;raw = tail\n"_qs);
    bag.SaveRegistry(AppTitle(), u"Bags"_qs, u"Reclama"_qs);
    QCOMPARE(GetSetting(AppTitle(), u"bags"_qs, u"RECLAMA"_qs), bag.CurrentFileText());

    clsFileBag loaded;
    loaded.SetCurrentFileName(u"other"_qs);
    loaded.OpenRegistry(AppTitle(), u"Bags"_qs, u"Reclama"_qs, u"default"_qs);
    QCOMPARE(loaded.CurrentFileText(), bag.CurrentFileText());
    QCOMPARE(loaded.CurrentFileName(), u"other"_qs);
    QVERIFY(!loaded.Changed());
    QCOMPARE(loaded.GetValue(clsFileBag::MakeKey(u"ads"_qs, u"text"_qs)), u"line 1\r\nline 2\\n"_qs);

    loaded.OpenRegistry(AppTitle(), u"Bags"_qs, u"Missing"_qs, u"<>d<v"_qs);
    QCOMPARE(loaded.CurrentFileText(), u"<>d<v"_qs);
}

QTEST_GUILESS_MAIN(TestClsFileBag)
#include "tst_clsfilebag.moc"
