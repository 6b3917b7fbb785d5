// The settings store, the catalogue kept in it, and the record files beside the games.
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/InfoFiles.h"
#include "store/IniDocument.h"
#include "store/SettingsStore.h"
#include "store/clsFileBag.h"

#include "TestEnvironment.h"
#include "TestFiles.h"

#include <QTest>

#include <sys/wait.h>
#include <unistd.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Pairs = QList<QPair<QString, QString>>;

namespace {

const QString files = u"Files"_s;

QString get(const QString& section, const QString& key)
{
    return GetSetting(AppTitle(), section, key, u"none"_s);
}

bool save(const QString& section, const QString& key, const QString& value)
{
    return SaveSetting(AppTitle(), section, key, value);
}

// Another process writing the store, as the service does: key prefix + i = value for each i; true when it
// saved them all.
bool writeFromChild(const QString& prefix, int count, const QString& value, const std::function<void()>& meanwhile)
{
    const pid_t pid = ::fork();
    if (pid == 0) {
        for (int i = 0; i < count; ++i)
            if (!save(files, prefix + QString::number(i), value))
                ::_exit(1);
        ::_exit(0);
    }
    meanwhile();
    int status = 0;
    return ::waitpid(pid, &status, 0) == pid && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

clsFileBag bagWith(const QString& text)
{
    clsFileBag bag;
    bag.SetCurrentFileText(text);
    return bag;
}

} // namespace

class TestStore : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;

private Q_SLOTS:
    void init() { m_env = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_env.reset(); }

    void calls_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const auto all = [](const QString& section) -> QString {
            QString text;
            for (const auto& [key, value] : GetAllSettings(AppTitle(), section))
                text += key + u'=' + value + u';';
            return text;
        };
        // Read in other letters, written over in them, then a key not there.
        const auto inAnyCase
            = [&all](const QString& section, const QString& key, const QString& s, const QString& k) -> QString {
            TestEnvironment env;
            save(section, key, u"1"_s);
            const QString first = get(s, k);
            save(s, k, u"2"_s);
            return first + u'|' + all(section) + u'|' + get(section, key + u'x');
        };
        // Values read back from the bytes on disk by the file's own rules, beside a later section.
        const auto onDisk = [](const QString& section, const QString& key, const QString& value) -> QString {
            TestEnvironment env;
            save(section, key, value);
            save(u"Other"_s, u"After"_s, u"2"_s);
            const IniDocument doc = IniDocument::parse(ReadFile(env.settingsFile()));
            return doc.value(section, key).value_or(u"missing"_s) + u'|'
                + doc.value(u"Other"_s, u"After"_s).value_or(QString()) + u'|'
                + QString::number(doc.sectionPairs(section).size());
        };
        const auto countIn = [](const QByteArray& bytes) -> QString {
            TestEnvironment env;
            WriteFile(env.settingsFile(), bytes);
            return get(files, u"count"_s);
        };
        // Defaults for every read, failure for every write, and nothing in the way is destroyed.
        const auto notAFile = [&all](bool folder) -> QString {
            TestEnvironment env;
            const QString path = env.settingsFile();
            folder ? WriteFile(path + u"/keep.txt"_s, "precious") : MakeNamedPipe(path);
            return get(files, u"Count"_s) + all(files) + QString::number(save(files, u"Count"_s, u"1"_s))
                + QString::number(DeleteSetting(AppTitle(), files, u"Count"_s))
                + QString::number(DeleteSection(AppTitle(), files)) + QString::number(QFileInfo(path).isDir())
                + QString::fromUtf8(ReadFile(path + u"/keep.txt"_s));
        };
        // The key a new game gets, the counter after it, and "lost" when an entry changed on the way.
        const auto addTo = [](const QByteArray& entries) -> QString {
            TestEnvironment env;
            WriteFile(env.settingsFile(), "[Files]\n" + entries + '\n');
            const auto before = GetAllSettings(AppTitle(), files);
            QString result = CatalogueStore::AddGame(u"/g/new.exe"_s);
            result += u'|' + get(files, u"Count"_s);
            for (const auto& [key, value] : before)
                result += key == u"Count" || get(files, key) == value ? QString() : u" lost"_s;
            return result + u'|' + QString::number(CatalogueStore::AddedGames().size());
        };
        // Both lookups, by the first entry of a path ignoring letter case and surrounding blanks.
        const auto lookUp = [](const QString& path) -> QString {
            TestEnvironment env;
            for (const char* added :
                {"/g/first.exe", " C:\\Games\\Lines.EXE", "c:\\GAMES\\lines.exe", "/игры/Линии.exe"})
                CatalogueStore::AddGame(QString::fromUtf8(added));
            const auto game = CatalogueStore::FindAddedGame(path);
            const auto index = CatalogueStore::IndexByPath(CatalogueStore::AddedGames());
            return (game ? game->key : QString()) + u'|' + index.value(CatalogueStore::NormalisedPath(path)).key + u'|'
                + QString::number(index.size());
        };
        const auto infoName = [](const QByteArray& content, const QString& lngNik, const QString& game) -> QString {
            TestEnvironment env;
            WriteFile(env.path(u"g/lines.bvxinf"_s), content);
            QDir().mkpath(env.path(u"g/folder.bvxinf"_s));
            return InfoFiles::GameInfoName(env.path(u"g/"_s + game), lngNik);
        };
        const auto stops = [](const QByteArray& content) -> QString {
            TestEnvironment env;
            const QString folder = env.path(u"pack"_s);
            QString answers = QString::number(InfoFiles::IsStopFolder(folder));
            WriteFile(folder + u"/DirInfo.bvxinf"_s, content);
            for (const QString& end : {QString(), u"/"_s, u"\\"_s})
                answers += QString::number(InfoFiles::IsStopFolder(folder + end));
            return answers;
        };
        const auto infoFile = &InfoFiles::GameInfoFileName;
        const QString a = u"<>a<"_s;
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
        QTest::newRow("ASCII in any case")
            << inAnyCase(u"Commands"_s, u"NewGame"_s, u"COMMANDS"_s, u"newgame"_s) << u"1|NewGame=2;|none"_s;
        QTest::newRow("non-ASCII in any case")
            << inAnyCase(u"Ёлка"_s, u"Ключ"_s, u"ёЛКА"_s, u"КЛЮЧ"_s) << u"1|Ключ=2;|none"_s;
        const QString mixed = u"a\r\nb\rc\nd C:\\new\\r\\n\\"_s;
        QTest::newRow("line ends, escape look-alikes") << onDisk(files, u"F1"_s, mixed) << mixed + u"|2|1"_s;
        QTest::newRow("blanks, syntax") << onDisk(files, u"F2"_s, u"  [x]=;# "_s) << u"  [x]=;# |2|1"_s;
        const QString nul = u"a"_s + QChar(0) + u"b"_s;
        QTest::newRow("NUL") << onDisk(files, u"F4"_s, nul) << nul + u"|2|1"_s;
        QTest::newRow("comment-like key with equals") << onDisk(files, u";a=b"_s, u"v"_s) << u"v|2|1"_s;
        QTest::newRow("bracket section") << onDisk(u"a]b["_s, u"k"_s, u"v"_s) << u"v|2|1"_s;
        QTest::newRow("byte order mark") << countIn("\xEF\xBB\xBF[Files]\nCount=3\n") << u"3"_s;
        QTest::newRow("blanks around header") << countIn("[Other]\nCount=1\n  [Files] \nCount=3") << u"3"_s;
        QTest::newRow("first of a split section") << countIn("[Files]\nCount=3\n[FILES]\nCount=4") << u"3"_s;
        QTest::newRow("entry before any section") << countIn("Count=1\n[Files]\n") << u"none"_s;
        QTest::newRow("invalid UTF-8 entry") << countIn("[Files]\nCount=\xe9\n") << u"none"_s;
        QTest::newRow("folder in the way") << notAFile(true) << u"none0001precious"_s;
        QTest::newRow("named pipe in the way") << notAFile(false) << u"none0000"_s;
        QTest::newRow("counter not a number") << addTo("Count=abc\nFile1=/1\nFile2=/2") << u"File3|3|3"_s;
        QTest::newRow("counter with blanks") << addTo("Count= 7 ") << u"File8|8|1"_s;
        QTest::newRow("counter too low") << addTo("Count=1\nFile1=/1\nfile4=/4") << u"File5|5|3"_s;
        QTest::newRow("counter negative") << addTo("Count=-3") << u"File1|1|1"_s;
        // The largest number there is has been given out: the first free one is taken, the counter stays.
        QTest::newRow("entry at the largest number")
            << addTo("Count=5\nFile2147483647=/m\nFile1=/1") << u"File2|2147483647|3"_s;
        QTest::newRow("counter in any case, blanks") << addTo(" COUNT =1\nFile1=/1") << u"File2|2|2"_s;
        QTest::newRow("Counter is an entry") << addTo("Counter=/c") << u"File1|1|2"_s;
        QTest::newRow("path with blanks") << lookUp(u"\tC:\\Games\\Lines.EXE  "_s) << u"File2|File2|3"_s;
        QTest::newRow("non-ASCII path") << lookUp(u"/ИГРЫ/линии.EXE"_s) << u"File4|File4|3"_s;
        QTest::newRow("inner blank differs") << lookUp(u"C:\\Games\\Li nes.exe"_s) << u"||3"_s;
        QTest::newRow("info file of a Windows path") << infoFile(u"C:\\Games\\foo.exe"_s) << u"C:\\Games\\foo.bvxinf"_s;
        QTest::newRow("info file of a bare name") << infoFile(u"foo.exe"_s) << u".\\foo.bvxinf"_s;
        QTest::newRow("info file, dot in folder only") << infoFile(u"C:\\a.b\\file"_s) << u"C:\\a.b\\file.bvxinf"_s;
        QTest::newRow("info file of an address, query cut first")
            << infoFile(u"http://s/g.swf?x=1/2"_s) << u"http://s/g.bvxinf"_s;
        QTest::newRow("info file, name is extension only") << infoFile(u"dir/.hidden"_s) << u"dir/.bvxinf"_s;
        const QByteArray both("<>Name<\xd0\x9b\xd0\xb8\xd0\xbd\xd0\xb8\xd0\xb8\r\n<>Name_ENG<Lines");
        QTest::newRow("name in the language") << infoName(both, u"ENG"_s, u"lines.exe"_s) << u"Lines"_s;
        QTest::newRow("name of other language falls back") << infoName(both, u"RUS"_s, u"lines.exe"_s) << u"Линии"_s;
        QTest::newRow("blank language name")
            << infoName("<>Name_ENG<   \r\n<>Name<D", u"ENG"_s, u"lines.exe"_s) << u"D"_s;
        QTest::newRow("name trimmed") << infoName("<>Name<  Lines  \r\n", u"ENG"_s, u"lines.exe"_s) << u"Lines"_s;
        QTest::newRow("name key letter case") << infoName("<>NAME_eng<X", u"ENG"_s, u"lines.exe"_s) << u"X"_s;
        QTest::newRow("folder as info file") << infoName("<>Name<X", u"ENG"_s, u"folder.exe"_s) << QString();
        QTest::newRow("stop mark Yes among records") << stops("<>Other<1\r\n<>stopdir<  Yes  \r\n") << u"0111"_s;
        QTest::newRow("stop mark yes") << stops("<>StopDir<yes") << u"0000"_s;
    }
    void calls()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    // A section written in two places (by hand) reads, changes and goes as one, in the file's order.
    void splitSectionAndDeletion()
    {
        QVERIFY(WriteFile(m_env->settingsFile(), "[Files]\nFile1=/a\nCount=1\n[Other]\nx=1\n[files]\nFile2=/b\n"));
        QVERIFY(save(files, u"file2"_s, u"/c"_s) && save(files, u"FILE1"_s, u"/A"_s) && save(files, u"F3"_s, u"/d"_s));
        QCOMPARE(GetAllSettings(AppTitle(), files),
            Pairs({{u"File1"_s, u"/A"_s}, {u"Count"_s, u"1"_s}, {u"F3"_s, u"/d"_s}, {u"File2"_s, u"/c"_s}}));
        QVERIFY(DeleteSetting(AppTitle(), u"FILES"_s, u"file1"_s) && !DeleteSetting(AppTitle(), files, u"File1"_s));
        QVERIFY(!DeleteSetting(AppTitle(), u"Missing"_s, u"File2"_s));
        QCOMPARE(get(files, u"File1"_s) + get(files, u"File2"_s), u"none/c"_s);
        QVERIFY(DeleteSection(AppTitle(), u"files"_s) && !DeleteSection(AppTitle(), files));
        QVERIFY(GetAllSettings(AppTitle(), files).isEmpty() && get(u"Other"_s, u"x"_s) == u"1");
    }

    // Same-size changes right after a read, as the service flips a flag and the timer resets it.
    void otherProcessesWriteTheSameFile()
    {
        for (int round = 1; round <= 3; ++round) {
            QVERIFY(save(files, u"Flag0"_s, u"0"_s));
            QCOMPARE(get(files, u"Flag0"_s), u"0"_s);
            QVERIFY(writeFromChild(u"Flag"_s, 1, QString::number(round), [] {}));
            QCOMPARE(get(files, u"Flag0"_s), QString::number(round));
        }
        const auto writeOwn = [] {
            for (int i = 0; i < 50; ++i)
                QVERIFY(save(files, u"C"_s + QString::number(i), u"c"_s));
        };
        QVERIFY(writeFromChild(u"A"_s, 50, u"a"_s, [&] { QVERIFY(writeFromChild(u"B"_s, 50, u"b"_s, writeOwn)); }));
        QCOMPARE(GetAllSettings(AppTitle(), files).size(), 151);
        QCOMPARE(get(files, u"A49"_s) + get(files, u"B0"_s) + get(files, u"C49"_s), u"abc"_s);
    }

    void damagedFileKeepsItsBytes()
    {
        const QByteArray head = QByteArrayLiteral(
            "[Files]\r\nCount=2\r\n\xff\xfe garbage \x00\x01\r\nFile1=/a\\q\r\n\xc3\x28 invalid=utf8\n");
        QVERIFY(WriteFile(m_env->settingsFile(), head + "[Other]\nx=\xe9"));
        QCOMPARE(get(files, u"File1"_s), u"/aq"_s);
        QVERIFY(save(files, u"File1"_s, u"/aq"_s));
        QCOMPARE(ReadFile(m_env->settingsFile()), head + "[Other]\nx=\xe9");
        QVERIFY(save(files, u"File3"_s, u"/c"_s) && save(u"Other"_s, u"y"_s, u"1"_s));
        QCOMPARE(ReadFile(m_env->settingsFile()), head + "File3=/c\r\n[Other]\nx=\xe9\r\ny=1\r\n");
    }

    // A removed game's number is not given out again, and its display name goes with it.
    void numbersAreNeverReused()
    {
        for (const char* path : {"/g/one.exe", "/g/two.exe", "/g/three.swf"})
            CatalogueStore::AddGame(QString::fromLatin1(path));
        CatalogueStore::SetDisplayName(u"File2"_s, u"Second"_s);
        CatalogueStore::SetDisplayName(u"file3"_s, u"  Third "_s);
        CatalogueStore::RemoveGame(u"File2"_s);
        QCOMPARE(get(u"FilesNames"_s, u"FileName2"_s), u"none"_s);
        QCOMPARE(CatalogueStore::AddGame(u"/g/four.exe"_s), u"File4"_s);
        QStringList keys;
        for (const auto& game : CatalogueStore::AddedGames())
            keys.append(game.key + u'=' + game.path);
        QCOMPARE(keys, (QStringList {u"File1=/g/one.exe"_s, u"File3=/g/three.swf"_s, u"File4=/g/four.exe"_s}));
        QCOMPARE(CatalogueStore::DisplayName(u"FILE3"_s), u"  Third "_s);
    }

    void dataFolders()
    {
        const QString base = m_env->path(u"commonappdata/Brimvault/"_s);
        QCOMPARE(DataFolders::GamesFolder() + u'|' + DataFolders::IconsFolder() + u'|' + DataFolders::ReclamaFolder(),
            base + u'|' + base + u"Icons/|"_s + base + u"Reclama/"_s);
        qputenv("BRIMVAULT_COMMON_APPDATA", "   ");
        QCOMPARE(DataFolders::GamesFolder() + DataFolders::IconsFolder() + DataFolders::ReclamaFolder(), QString());
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
        QString name = m_env->path(u"game.bvxinf"_s);
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
        const QString path = m_env->path(u"new/game.bvxinf"_s);
        clsFileBag bag = bagWith(u"<>a<1"_s);
        QVERIFY(!bag.OpenFile(path) && bag.CurrentFileText().isEmpty());
        bag.SetRecord(u"<>Name<"_s, u"Игра"_s);
        bag.SetRecord(u"<>Name_ENG<"_s, u"Game\r\n2"_s);
        QVERIFY(bag.SaveFile() && !bag.Changed());
        QCOMPARE(ReadFile(path), QByteArray("<>Name<\xd0\x98\xd0\xb3\xd1\x80\xd0\xb0\r\n<>Name_ENG<Game\\{NL}\\2"));
        QVERIFY(bag.RemoveRecord(u"<>name"_s, true));
        QVERIFY(bag.SaveFile() && !QFile::exists(path));
        bag.OpenFile(m_env->root() + u"\\win\\game.bvxinf"_s);
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(bag.SaveFile() && ReadFile(m_env->path(u"win/game.bvxinf"_s)) == "<>a<1");
        bag.OpenFile(m_env->path(u"two/levels/game.bvxinf"_s));
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(!bag.SaveFile() && bag.Changed());
        QVERIFY(bag.OpenFile(QString()) && bag.CurrentFileText().isEmpty() && !bag.Changed());
        bag.SetRecord(u"<>a<"_s, u"1"_s);
        QVERIFY(bag.SaveFile() && !bag.Changed());
    }
};

QTEST_GUILESS_MAIN(TestStore)
#include "tst_store.moc"
