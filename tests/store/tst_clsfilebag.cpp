#include "store/clsFileBag.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

clsFileBag bagWith(const QString& text)
{
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    return bag;
}

} // namespace

class TestClsFileBag : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void calls_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const QString a = u"<>a<"_s;
        const QString adsUrl = u"<>ads<>>URL<"_s;
        const auto stored = [](const QString& value) -> QString {
            clsFileBag bag;
            bag.SetRecord(u"<>k<"_s, value);
            return bag.CurrentFileText().mid(4);
        };
        const auto read = [](const QString& text) -> QString { return bagWith(u"<>k<"_s + text).GetValue(u"<>K<"_s); };
        const auto lookup = [](const QString& text, const QString& key) -> QString {
            return bagWith(text).GetRecord(key) + u'|' + bagWith(text).GetValue(key, u"dflt"_s);
        };
        // The text after the edit, "*" when the bag counts as changed, "*" more when removing says so.
        const auto edit = [](const QString& text, const QString& key, char how) -> QString {
            clsFileBag bag = bagWith(text);
            const bool removed = how == 's' ? (bag.SetRecord(key, u"9"_s), false) : bag.RemoveRecord(key, how == 'a');
            return bag.CurrentFileText() + (bag.Changed() ? u"*"_s : QString()) + (removed ? u"*"_s : QString());
        };
        QTest::newRow("key of two parts") << clsFileBag::MakeKey(u"ads"_s, u"URL"_s) << adsUrl;
        QTest::newRow("key, empty part keeps its number")
            << clsFileBag::MakeKey(u"a"_s, QString(), u"c"_s) << u"<>a<>>>c<"_s;
        QTest::newRow("key escaped") << clsFileBag::MakeKey(u"a<b"_s, u"x>y\r\nz"_s)
                                     << u"<>a\\{[}\\b<>>x\\{]}\\y\\{NL}\\z<"_s;
        QTest::newRow("escape all") << stored(u"a<b>c\r\nd"_s) << u"a\\{[}\\b\\{]}\\c\\{NL}\\d"_s;
        QTest::newRow("lone CR and LF raw") << stored(u"a\rb\nc\n\r"_s) << u"a\rb\nc\n\r"_s;
        QTest::newRow("unescape ignores case") << read(u"a\\{nl}\\b\\{Nl}\\"_s) << u"a\r\nb\r\n"_s;
        // The backslash between two sequences is shared: "<" is replaced first and takes it.
        QTest::newRow("unescape order") << read(u"\\{[}\\{]}\\"_s) << u"<{]}\\"_s;
        QTest::newRow("lookup ignores case") << lookup(u"<>Ads<v"_s, u"<>ADS<"_s) << u"<>Ads<v|v"_s;
        QTest::newRow("lookup, middle line") << lookup(u"<>b<1\r\n<>a<2\r\n<>c<3"_s, a) << u"<>a<2|2"_s;
        QTest::newRow("lookup, longer key first") << lookup(u"<>a<>>x<1\r\n<>a<2"_s, a) << u"<>a<>>x<1|1"_s;
        QTest::newRow("lookup anywhere in a line") << lookup(u"junk<>a<v"_s, a) << u"junk<>a<v|v"_s;
        QTest::newRow("lookup, empty value") << lookup(a, a) << u"<>a<|dflt"_s;
        QTest::newRow("lookup, missing") << lookup(u"<>b<1"_s, a) << u"|dflt"_s;
        QTest::newRow("lookup, lone LF joins lines") << lookup(u"<>a<1\n<>b<2"_s, a) << u"<>a<1\n<>b<2|2"_s;
        const QString three = u"<>a<1\r\n<>b<2\r\n<>A<3"_s;
        QTest::newRow("set, second record") << edit(u"<>a<1"_s, u"<>b<"_s, 's') << u"<>a<1\r\n<>b<9*"_s;
        QTest::newRow("set after final line end") << edit(u"<>a<1\r\n"_s, u"<>b<"_s, 's') << u"<>a<1\r\n<>b<9*"_s;
        QTest::newRow("set keeps place") << edit(three, u"<>B<"_s, 's') << u"<>a<1\r\n<>B<9\r\n<>A<3*"_s;
        QTest::newRow("set whole line of prefix") << edit(u"<>a<>>x<1"_s, a, 's') << u"<>a<9*"_s;
        QTest::newRow("set, two characters") << edit(u"xy"_s, a, 's') << u"xy<>a<9*"_s;
        QTest::newRow("set, three characters") << edit(u"xyz"_s, a, 's') << u"xyz\r\n<>a<9*"_s;
        QTest::newRow("remove all, last keeps line end before it") << edit(three, a, 'a') << u"<>b<2\r\n**"_s;
        QTest::newRow("remove adjacent") << edit(u"<>b<0\r\n<>a<1\r\n<>a<2\r\n<>b<3"_s, a, 'a')
                                         << u"<>b<0\r\n<>b<3**"_s;
    }
    void calls()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    // Neither reading nor saving may hang, fill the memory or replace what the bag could not read.
    void openFile_data()
    {
        QTest::addColumn<QString>("kind"); // a file of these bytes, or what stands in its place
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<bool>("readable");
        QTest::addColumn<QString>("text");
        QTest::newRow("UTF-8, CR LF kept") << u"file"_s << QByteArray("<>a<1\r\n<>b<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0")
                                           << true << u"<>a<1\r\n<>b<Игра"_s;
        QTest::newRow("garbage") << u"file"_s << QByteArray("\xff\x00\r\n<>b<\x80x", 10) << true
                                 << QStringLiteral("\uFFFD") + QChar(0) + u"\r\n<>b<\uFFFDx"_s;
        QTest::newRow("empty file") << u"file"_s << QByteArray() << true << QString();
        const QByteArray huge(8 * 1024 * 1024, 'x');
        QTest::newRow("huge line") << u"file"_s << huge + "<>b<" << true << QString::fromLatin1(huge + "<>b<");
        QTest::newRow("65 MB file") << u"file"_s << QByteArray(65 * 1024 * 1024, 'x') << false << QString();
        QTest::newRow("folder") << u"folder"_s << QByteArray() << false << QString();
        QTest::newRow("named pipe") << u"fifo"_s << QByteArray() << false << QString();
        QTest::newRow("endless device") << u"/dev/zero"_s << QByteArray() << false << QString();
    }
    void openFile()
    {
        QFETCH(QString, kind);
        QFETCH(QByteArray, bytes);
        QFETCH(bool, readable);
        TestEnvironment env;
        QString name = env.path(u"game.bvxinf"_s);
        if (kind == u"file" || kind == u"folder")
            QVERIFY(WriteFile(kind == u"file" ? name : name + u"/inside"_s, bytes));
        else if (kind == u"fifo")
            QVERIFY(MakeNamedPipe(name));
        else
            name = kind;
        const auto size = QFileInfo(name).size();
        clsFileBag bag = bagWith(u"<>old<x"_s);
        QCOMPARE(bag.OpenFile(name), readable);
        QTEST(bag.CurrentFileText(), "text");
        QVERIFY(!bag.Changed());
        if (readable)
            return;
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(!bag.SaveFile() && bag.Changed());
        QCOMPARE(QFileInfo(name).size(), size);
        QVERIFY(kind != u"folder" || QFileInfo::exists(name + u"/inside"_s));
    }

    void saveFile()
    {
        TestEnvironment env;
        const QString path = env.path(u"new/game.bvxinf"_s);
        clsFileBag bag = bagWith(u"<>a<1"_s);
        QVERIFY(!bag.OpenFile(path) && bag.CurrentFileText().isEmpty());
        bag.SetRecord(u"<>Name<"_s, u"Игра"_s);
        bag.SetRecord(u"<>Name_ENG<"_s, u"Game\r\n2"_s);
        QVERIFY(bag.SaveFile() && !bag.Changed());
        QCOMPARE(ReadFile(path), QByteArray("<>Name<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0\r\n<>Name_ENG<Game\\{NL}\\2"));
        QVERIFY(bag.RemoveRecord(u"<>name"_s, true));
        QVERIFY(bag.SaveFile() && !QFile::exists(path));
        QVERIFY(bag.SaveFile() && !QFile::exists(path));
        bag.OpenFile(env.root() + u"\\win\\game.bvxinf"_s);
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(bag.SaveFile() && ReadFile(env.path(u"win/game.bvxinf"_s)) == "<>a<1");
        bag.OpenFile(env.path(u"two/levels/game.bvxinf"_s));
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(!bag.SaveFile() && bag.Changed());
        QVERIFY(bag.OpenFile(QString()) && bag.CurrentFileText().isEmpty() && !bag.Changed());
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(bag.SaveFile() && !bag.Changed());
    }
};

BV_REGISTER_TEST(TestClsFileBag);
#include "tst_clsfilebag.moc"
