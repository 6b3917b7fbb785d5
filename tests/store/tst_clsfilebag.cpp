#include "store/SettingsStore.h"
#include "store/clsFileBag.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QtTest>

using namespace Brimvault;

namespace {

QString bs(const char* latin1)
{
    return QString::fromLatin1(latin1);
}

clsFileBag bagWith(const QString& text)
{
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    return bag;
}

// The value as the bag's text holds it, and the value read back from a stored text.
QString storedAs(const QString& value)
{
    clsFileBag bag;
    bag.SetRecord(u"<>k<"_qs, value);
    return bag.CurrentFileText().mid(4);
}

QString valueOf(const QString& stored)
{
    return bagWith(u"<>k<"_qs + stored).GetValue(u"<>K<"_qs, u"dflt"_qs);
}

} // namespace

class TestClsFileBag : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void calls_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const QString adsUrl = u"<>ads<>>URL<"_qs;
        QTest::newRow("key of two parts") << clsFileBag::MakeKey(u"ads"_qs, u"URL"_qs) << adsUrl;
        QTest::newRow("key, empty part keeps its number")
            << clsFileBag::MakeKey(u"a"_qs, QString(), u"c"_qs) << u"<>a<>>>c<"_qs;
        QTest::newRow("key of no parts") << clsFileBag::MakeKey() << u"<"_qs;
        QTest::newRow("key escaped") << clsFileBag::MakeKey(u"a<b"_qs, u"x>y\r\nz"_qs)
                                     << bs("<>a\\{[}\\b<>>x\\{]}\\y\\{NL}\\z<");
        QTest::newRow("key of number and flag") << clsFileBag::MakeKey(3, true) << u"<>3<>>True<"_qs;
        QTest::newRow("field 0") << clsFileBag::GetField(adsUrl, 0) << QString();
        QTest::newRow("field 2") << clsFileBag::GetField(adsUrl, 2) << u"URL"_qs;
        QTest::newRow("field beyond") << clsFileBag::GetField(adsUrl, 3) << QString();
        QTest::newRow("field negative") << clsFileBag::GetField(adsUrl, -1) << QString();
        QTest::newRow("fields shift after empty part") << clsFileBag::GetField(u"<>>b<"_qs, 1) << u"b"_qs;
        QTest::newRow("field unescaped") << clsFileBag::GetField(bs("<>a\\{[}\\b\\{NL}\\<"), 1) << u"a<b\r\n"_qs;
        QTest::newRow("record value") << clsFileBag::GetValueFromRecord(u"<>a<x<y"_qs, u"d"_qs) << u"y"_qs;
        QTest::newRow("record empty value") << clsFileBag::GetValueFromRecord(u"<>a<"_qs, u"d"_qs) << u"d"_qs;
        QTest::newRow("record without key") << clsFileBag::GetValueFromRecord(u"plain"_qs, u"d"_qs) << u"plain"_qs;
        QTest::newRow("left to last") << clsFileBag::LeftTo(bs("C:\\a\\b"), bs("\\"), 0, true) << bs("C:\\a");
        QTest::newRow("left to first") << clsFileBag::LeftTo(bs("C:\\a\\b"), bs("\\"), 0, false) << u"C:"_qs;
        QTest::newRow("left to, exact") << clsFileBag::LeftTo(u"aXbxc"_qs, u"x"_qs, 0, false) << u"aXb"_qs;
        QTest::newRow("left to, text") << clsFileBag::LeftTo(u"aXbxc"_qs, u"x"_qs, 1, false) << u"a"_qs;
        QTest::newRow("left to, text, last") << clsFileBag::LeftTo(u"axbXc"_qs, u"x"_qs, 1, true) << u"axb"_qs;
        QTest::newRow("left to, missing") << clsFileBag::LeftTo(u"abc"_qs, u"x"_qs, 0, true) << u"abc"_qs;
        QTest::newRow("left to, long separator") << clsFileBag::LeftTo(u"a<>b<>c"_qs, u"<>"_qs, 0, true) << u"a<>b"_qs;

        QTest::newRow("escape all") << storedAs(u"a<b>c\r\nd"_qs) << bs("a\\{[}\\b\\{]}\\c\\{NL}\\d");
        QTest::newRow("lone CR and LF raw") << storedAs(u"a\rb\nc\n\r"_qs) << u"a\rb\nc\n\r"_qs;
        QTest::newRow("CR before the pair") << storedAs(u"\r\r\n"_qs) << bs("\r\\{NL}\\");
        QTest::newRow("backslash raw") << storedAs(bs("C:\\x\\")) << bs("C:\\x\\");
        QTest::newRow("round trip") << valueOf(storedAs(u"a<b>c\r\nd\r"_qs)) << u"a<b>c\r\nd\r"_qs;
        QTest::newRow("unescape ignores case") << valueOf(bs("a\\{nl}\\b\\{Nl}\\")) << u"a\r\nb\r\n"_qs;
        // The backslash between two sequences is shared: "<" is replaced first and takes it.
        QTest::newRow("unescape order") << valueOf(bs("\\{[}\\{]}\\")) << bs("<{]}\\");
        QTest::newRow("unescape NL last") << valueOf(bs("\\{]\\{NL}\\}\\")) << bs("\\{]\r\n}\\");
        QTest::newRow("escape text itself") << valueOf(bs("\\{NL}\\")) << u"\r\n"_qs;

        const QString text = bs("<>a<>>x<1\r\n<>b<2\r\n<>A<>>y<3\\{[}\\");
        QTest::newRow("all keys") << bagWith(text).GetAll(u"<>a<"_qs, 0).join(u'|') << u"<>a<>>x<|<>A<>>y<|"_qs;
        QTest::newRow("all values") << bagWith(text).GetAll(u"<>a<"_qs, 1).join(u'|') << u"1|3<|"_qs;
        QTest::newRow("all lines") << bagWith(text).GetAll(u"<>a<"_qs, 2).join(u'|')
                                   << bs("<>a<>>x<1|<>A<>>y<3\\{[}\\|");
        QTest::newRow("all, other mode") << bagWith(text).GetAll(u"<>a<"_qs, 7).join(u'|') << u"||"_qs;
        QTest::newRow("all, no match") << QString::number(bagWith(text).GetAll(u"<>z<"_qs, 0).size()) << u"1"_qs;
        QTest::newRow("all, two keys on a line")
            << bagWith(u"<>a<1<>a<2\r\n<>a<3"_qs).GetAll(u"<>a<"_qs, 2).join(u'|') << u"<>a<1<>a<2|<>a<3|"_qs;
        const auto count = [](const QString& t) { return QString::number(bagWith(t).RecordCount()); };
        QTest::newRow("count, empty") << count(QString()) << u"0"_qs;
        QTest::newRow("count, final line end") << count(u"<>a<1\r\n<>b<2\r\n"_qs) << u"2"_qs;
        QTest::newRow("count, two keys one line") << count(u"<>a<1<>b<2"_qs) << u"1"_qs;
        QTest::newRow("count, plain lines") << count(u"plain\r\n<>a<1\r\nplain"_qs) << u"1"_qs;
        QTest::newRow("count, lone LF") << count(u"<>a<1\n<>b<2"_qs) << u"1"_qs;
        QTest::newRow("count, empty lines first") << count(u"\r\n\r\n<>a<"_qs) << u"1"_qs;
        QTest::newRow("count, key on last line") << count(u"<>a<1\r\nx\r\n<>c"_qs) << u"2"_qs;
        QTest::newRow("count, lone key") << count(u"<"_qs) << u"0"_qs;
    }
    void calls()
    {
        QFETCH(QString, actual);
        QFETCH(QString, expected);
        QCOMPARE(actual, expected);
    }

    void lookup_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QString>("key");
        QTest::addColumn<QString>("record");
        QTest::addColumn<QString>("value");
        const QString a = u"<>a<"_qs;
        QTest::newRow("letter case") << u"<>Ads<v"_qs << u"<>ADS<"_qs << u"<>Ads<v"_qs << u"v"_qs;
        QTest::newRow("middle line") << u"<>b<1\r\n<>a<2\r\n<>c<3"_qs << a << u"<>a<2"_qs << u"2"_qs;
        QTest::newRow("longer key first") << u"<>a<>>x<1\r\n<>a<2"_qs << a << u"<>a<>>x<1"_qs << u"1"_qs;
        QTest::newRow("anywhere in a line") << u"junk<>a<v"_qs << a << u"junk<>a<v"_qs << u"v"_qs;
        QTest::newRow("empty value") << u"<>a<"_qs << a << u"<>a<"_qs << u"dflt"_qs;
        QTest::newRow("missing") << u"<>b<1"_qs << a << QString() << u"dflt"_qs;
        QTest::newRow("final line end") << u"<>a<x\r\n"_qs << a << u"<>a<x"_qs << u"x"_qs;
        QTest::newRow("lone LF joins lines") << u"<>a<1\n<>b<2"_qs << a << u"<>a<1\n<>b<2"_qs << u"2"_qs;
        QTest::newRow("lone CR joins lines") << u"<>b<2\r<>a<1"_qs << a << u"<>b<2\r<>a<1"_qs << u"1"_qs;
        QTest::newRow("two parts") << u"<>ads<>>URL<http://x/"_qs << u"<>ads<>>url<"_qs << u"<>ads<>>URL<http://x/"_qs
                                   << u"http://x/"_qs;
    }
    void lookup()
    {
        QFETCH(QString, text);
        QFETCH(QString, key);
        QFETCH(QString, record);
        QFETCH(QString, value);
        const clsFileBag bag = bagWith(text);
        QCOMPARE(bag.GetRecord(key), record);
        QCOMPARE(bag.GetValue(key, u"dflt"_qs), value);
    }

    void edits_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QString>("operation");
        QTest::addColumn<QString>("key");
        QTest::addColumn<QString>("expected");
        const QString three = u"<>a<1\r\n<>b<2\r\n<>A<3"_qs;
        QTest::newRow("set, empty bag") << QString() << u"set 1"_qs << u"<>a<"_qs << u"<>a<1"_qs;
        QTest::newRow("set, second record") << u"<>a<1"_qs << u"set 2"_qs << u"<>b<"_qs << u"<>a<1\r\n<>b<2"_qs;
        QTest::newRow("set after final line end")
            << u"<>a<1\r\n"_qs << u"set 2"_qs << u"<>b<"_qs << u"<>a<1\r\n<>b<2"_qs;
        QTest::newRow("set keeps place") << three << u"set x"_qs << u"<>B<"_qs << u"<>a<1\r\n<>B<x\r\n<>A<3"_qs;
        QTest::newRow("set whole line of prefix") << u"<>a<>>x<1"_qs << u"set 2"_qs << u"<>a<"_qs << u"<>a<2"_qs;
        QTest::newRow("set, two characters") << u"xy"_qs << u"set 1"_qs << u"<>a<"_qs << u"xy<>a<1"_qs;
        QTest::newRow("set, three characters") << u"xyz"_qs << u"set 1"_qs << u"<>a<"_qs << u"xyz\r\n<>a<1"_qs;
        QTest::newRow("set, lone LF line") << u"<>a<1\n<>b<2"_qs << u"set 3"_qs << u"<>b<"_qs << u"<>b<3"_qs;
        QTest::newRow("remove first only") << three << u"remove"_qs << u"<>a<"_qs << u"<>b<2\r\n<>A<3"_qs;
        QTest::newRow("remove all, last keeps line end before it")
            << three << u"remove all"_qs << u"<>a<"_qs << u"<>b<2\r\n"_qs;
        QTest::newRow("remove middle") << three << u"remove"_qs << u"<>b<"_qs << u"<>a<1\r\n<>A<3"_qs;
        QTest::newRow("remove missing") << u"<>a<1"_qs << u"remove all"_qs << u"<>b<"_qs << u"<>a<1"_qs;
        QTest::newRow("remove every line") << u"<>a<1\r\n<>a<2"_qs << u"remove all"_qs << u"<>a<"_qs << QString();
        QTest::newRow("remove adjacent") << u"<>b<0\r\n<>a<1\r\n<>a<2\r\n<>b<3"_qs << u"remove all"_qs << u"<>a<"_qs
                                         << u"<>b<0\r\n<>b<3"_qs;
    }
    void edits()
    {
        QFETCH(QString, text);
        QFETCH(QString, operation);
        QFETCH(QString, key);
        QFETCH(QString, expected);
        clsFileBag bag = bagWith(text);
        if (operation.startsWith(u"set "))
            bag.SetRecord(key, operation.mid(4));
        else
            QCOMPARE(bag.RemoveRecord(key, operation == u"remove all"), expected != text);
        QCOMPARE(bag.CurrentFileText(), expected);
        QCOMPARE(bag.Changed(), expected != text);
    }

    // Keys that MakeKey never builds still give an answer and never loop.
    void oddKeysTerminate_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QString>("key");
        QTest::newRow("empty key") << u"x\r\ny\r\n"_qs << QString();
        QTest::newRow("line end as key") << u"a\r\n\r\nb"_qs << u"\r\n"_qs;
        QTest::newRow("key across lines") << u"<>a<1\r\n<>b<2"_qs << u"1\r\n<"_qs;
    }
    void oddKeysTerminate()
    {
        QFETCH(QString, text);
        QFETCH(QString, key);
        clsFileBag bag = bagWith(text);
        QVERIFY(bag.GetAll(key, 2).size() <= text.size() + 1);
        bag.RemoveRecord(key, true);
        QVERIFY(bag.CurrentFileText().size() <= text.size());
    }

    void changedFlagAndSettings()
    {
        TestEnvironment env;
        clsFileBag bag;
        QVERIFY(!bag.Changed() && bag.CurrentFileName().isEmpty());
        bag.SaveSetting(u"ads"_qs, u"URL"_qs, 2, u"<b>"_qs);
        QCOMPARE(bag.CurrentFileText(), bs("<>ads<>>URL<>>>2<\\{[}\\b\\{]}\\"));
        QCOMPARE(bag.GetSetting(u"ADS"_qs, u"url"_qs, 2), u"<b>"_qs);
        QCOMPARE(bag.GetSetting(u"ads"_qs, u"URL"_qs, 4, u"none"_qs), u"none"_qs);
        QVERIFY(bag.Changed());
        bag.SaveRegistry(AppTitle(), u"Bags"_qs, u"Flag"_qs);
        bag.OpenRegistry(AppTitle(), u"Bags"_qs, u"Flag"_qs);
        QVERIFY(bag.Changed());
        bag.SetCurrentFileName(env.path(u"x.bvxinf"_qs));
        QVERIFY(bag.SaveFile());
        QVERIFY(!bag.Changed());
    }

    void registryRoundTrip()
    {
        TestEnvironment env;
        clsFileBag bag = bagWith(u"<>ads<>>Text<line 1\r\n;raw = tail\n[x]"_qs);
        bag.SaveRegistry(AppTitle(), u"Bags"_qs, u"Reclama"_qs);
        QCOMPARE(GetSetting(AppTitle(), u"bags"_qs, u"RECLAMA"_qs), bag.CurrentFileText());
        clsFileBag loaded;
        loaded.SetCurrentFileName(u"other"_qs);
        loaded.OpenRegistry(AppTitle(), u"Bags"_qs, u"Reclama"_qs, u"default"_qs);
        QCOMPARE(loaded.CurrentFileText(), bag.CurrentFileText());
        QCOMPARE(loaded.CurrentFileName(), u"other"_qs);
        loaded.OpenRegistry(AppTitle(), u"Bags"_qs, u"Missing"_qs, u"<>d<v"_qs);
        QCOMPARE(loaded.CurrentFileText(), u"<>d<v"_qs);
    }

    void openFile_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QString>("text");
        QTest::newRow("CR LF kept") << QByteArray("<>a<1\r\n<>b<2\r\n") << u"<>a<1\r\n<>b<2\r\n"_qs;
        QTest::newRow("UTF-8") << QByteArray("<>b<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0") << u"<>b<Игра"_qs;
        QTest::newRow("garbage") << QByteArray("\xff\x00\r\n<>b<\x80x", 10)
                                 << QStringLiteral("\uFFFD") + QChar(0) + u"\r\n<>b<\uFFFDx"_qs;
        QTest::newRow("cut multi-byte character") << QByteArray("<>b<x\xd0") << u"<>b<x\uFFFD"_qs;
        QTest::newRow("empty file") << QByteArray() << QString();
        QByteArray huge(8 * 1024 * 1024, 'x');
        QTest::newRow("huge line") << huge + "<>b<" << QString::fromLatin1(huge + "<>b<");
    }
    void openFile()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QString, text);
        TestEnvironment env;
        const QString path = env.path(u"game.bvxinf"_qs);
        QVERIFY(WriteFile(path, bytes));
        clsFileBag bag;
        bag.SetRecord(u"<>old<"_qs, u"x"_qs);
        QVERIFY(bag.OpenFile(path));
        QCOMPARE(bag.CurrentFileName(), path);
        QCOMPARE(bag.CurrentFileText(), text);
        QVERIFY(!bag.Changed());
    }

    void openMissingOrNoName()
    {
        TestEnvironment env;
        clsFileBag bag;
        bag.SetRecord(u"<>a<"_qs, u"1"_qs);
        QVERIFY(!bag.OpenFile(env.path(u"nothing/here.bvxinf"_qs)));
        QCOMPARE(bag.CurrentFileName(), env.path(u"nothing/here.bvxinf"_qs));
        QVERIFY(bag.CurrentFileText().isEmpty() && !bag.Changed());
        bag.SetRecord(u"<>a<"_qs, u"1"_qs);
        QVERIFY(bag.OpenFile(QString()));
        QVERIFY(bag.CurrentFileText().isEmpty() && !bag.Changed());
        bag.SetRecord(u"<>a<"_qs, u"1"_qs);
        QVERIFY(bag.SaveFile());
        QVERIFY(!bag.Changed());
        QCOMPARE(QDir(env.root()).entryList(QDir::Files).size(), 0);
    }

    // Neither reading nor saving may hang, fill the memory or replace what the bag could not read.
    void notAPlainFile_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::newRow("folder") << u"folder"_qs;
        QTest::newRow("named pipe") << u"fifo"_qs;
        QTest::newRow("endless device") << u"/dev/zero"_qs;
        QTest::newRow("65 MB file") << u"huge"_qs;
    }
    void notAPlainFile()
    {
        QFETCH(QString, kind);
        TestEnvironment env;
        QString name = env.path(u"odd.bvxinf"_qs);
        if (kind == u"folder") {
            QVERIFY(WriteFile(name + u"/inside"_qs));
        } else if (kind == u"fifo") {
            QVERIFY(MakeNamedPipe(name));
        } else if (kind == u"huge") {
            QFile file(name);
            QVERIFY(file.open(QIODevice::WriteOnly) && file.resize(65 * 1024 * 1024));
        } else {
            name = kind;
        }
        const auto before = QFileInfo(name).size();
        clsFileBag bag;
        QVERIFY(!bag.OpenFile(name));
        QVERIFY(bag.CurrentFileText().isEmpty());
        bag.SetRecord(u"<>a<"_qs, u"1"_qs);
        QVERIFY(!bag.SaveFile());
        QVERIFY(bag.Changed());
        QCOMPARE(QFileInfo(name).size(), before);
        if (kind == u"folder")
            QVERIFY(QFileInfo::exists(name + u"/inside"_qs));
    }

    void saveWritesTextExactly()
    {
        TestEnvironment env;
        const QString path = env.path(u"game.bvxinf"_qs);
        clsFileBag bag;
        QVERIFY(!bag.OpenFile(path));
        bag.SetRecord(u"<>Name<"_qs, u"Игра"_qs);
        bag.SetRecord(u"<>Name_ENG<"_qs, u"Game\r\n2"_qs);
        QVERIFY(bag.SaveFile());
        QVERIFY(!bag.Changed());
        QCOMPARE(ReadFile(path), QByteArray("<>Name<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0\r\n<>Name_ENG<Game\\{NL}\\2"));

        QVERIFY(bag.RemoveRecord(u"<>name"_qs, true));
        QVERIFY(bag.SaveFile());
        QVERIFY(!QFile::exists(path));
        QVERIFY(bag.SaveFile());
        QVERIFY(!QFile::exists(path));
    }

    void saveCreatesOneMissingFolder_data()
    {
        QTest::addColumn<QString>("relative");
        QTest::addColumn<bool>("saved");
        QTest::newRow("slash") << u"/new/game.bvxinf"_qs << true;
        QTest::newRow("backslash") << bs("\\new\\game.bvxinf") << true;
        QTest::newRow("two levels missing") << u"/new/deeper/game.bvxinf"_qs << false;
    }
    void saveCreatesOneMissingFolder()
    {
        QFETCH(QString, relative);
        QFETCH(bool, saved);
        TestEnvironment env;
        clsFileBag bag;
        bag.OpenFile(env.root() + relative);
        bag.SetRecord(u"<>a<"_qs, u"1"_qs);
        QCOMPARE(bag.SaveFile(), saved);
        QCOMPARE(bag.Changed(), !saved);
        QCOMPARE(ReadFile(env.root() + relative.replace(u'\\', u'/')), saved ? QByteArray("<>a<1") : QByteArray());
    }
};

BV_REGISTER_TEST(TestClsFileBag);
#include "tst_clsfilebag.moc"
