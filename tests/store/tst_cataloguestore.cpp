#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/InfoFiles.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QString get(const QString& section, const QString& key)
{
    return GetSetting(AppTitle(), section, key, u"gone"_s);
}

} // namespace

class TestCatalogueStore : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void calls_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        // The key a new game gets, the counter after it, and "lost" when an entry changed on the way.
        const auto addTo = [](const QByteArray& files) -> QString {
            TestEnvironment env;
            WriteFile(env.settingsFile(), "[Files]\n" + files + '\n');
            const auto before = GetAllSettings(AppTitle(), u"Files"_s);
            QString result = CatalogueStore::AddGame(u"/g/new.exe"_s);
            result += u'|' + get(u"Files"_s, u"Count"_s);
            for (const auto& [key, value] : before)
                result += key == u"Count" || get(u"Files"_s, key) == value ? QString() : u" lost"_s;
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
        QTest::newRow("counter not a number") << addTo("Count=abc\nFile1=/1\nFile2=/2") << u"File3|3|3"_s;
        QTest::newRow("counter with blanks") << addTo("Count= 7 ") << u"File8|8|1"_s;
        QTest::newRow("counter too low") << addTo("Count=1\nFile1=/1\nfile4=/4") << u"File5|5|3"_s;
        QTest::newRow("counter negative") << addTo("Count=-3") << u"File1|1|1"_s;
        // The largest number there is has been given out: the first free one is taken, the counter stays.
        QTest::newRow("counter at the largest number")
            << addTo("Count=2147483647\nFile1=/1\nFile3=/3") << u"File2|2147483647|3"_s;
        QTest::newRow("entry at the largest number")
            << addTo("Count=5\nFile2147483647=/m\nFile1=/1") << u"File2|2147483647|3"_s;
        QTest::newRow("counter in any case, blanks") << addTo(" COUNT =1\nFile1=/1") << u"File2|2|2"_s;
        QTest::newRow("Counter is an entry") << addTo("Counter=/c") << u"File1|1|2"_s;
        QTest::newRow("path in other case") << lookUp(u"c:\\games\\lines.exe"_s) << u"File2|File2|3"_s;
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
        QTest::newRow("other game's info file") << infoName("<>Name<X", u"ENG"_s, u"other.exe"_s) << QString();
        QTest::newRow("folder as info file") << infoName("<>Name<X", u"ENG"_s, u"folder.exe"_s) << QString();
        QTest::newRow("stop mark Yes among records") << stops("<>Other<1\r\n<>stopdir<  Yes  \r\n") << u"0111"_s;
        QTest::newRow("stop mark yes") << stops("<>StopDir<yes") << u"0000"_s;
    }
    void calls()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    void numbersAreNeverReused()
    {
        TestEnvironment env;
        QCOMPARE(CatalogueStore::AddGame(u"/g/one.exe"_s), u"File1"_s);
        QCOMPARE(CatalogueStore::AddGame(u"/g/two.exe"_s), u"File2"_s);
        QCOMPARE(CatalogueStore::AddGame(u"/g/three.swf"_s), u"File3"_s);
        CatalogueStore::SetDisplayName(u"File2"_s, u"Second"_s);
        CatalogueStore::SetDisplayName(u"file3"_s, u"  Third "_s);
        CatalogueStore::RemoveGame(u"File2"_s);
        QCOMPARE(get(u"FilesNames"_s, u"FileName2"_s), u"gone"_s);
        QCOMPARE(CatalogueStore::AddGame(u"/g/four.exe"_s), u"File4"_s);
        QCOMPARE(get(u"Files"_s, u"Count"_s), u"4"_s);
        QStringList keys;
        for (const auto& game : CatalogueStore::AddedGames())
            keys.append(game.key + u'=' + game.path);
        QCOMPARE(keys, (QStringList {u"File1=/g/one.exe"_s, u"File3=/g/three.swf"_s, u"File4=/g/four.exe"_s}));
        CatalogueStore::RemoveAllAddedGames();
        QVERIFY(CatalogueStore::AddedGames().isEmpty() && CatalogueStore::EntryCount() == 0);
        QCOMPARE(CatalogueStore::DisplayName(u"FILE3"_s), u"  Third "_s);
    }

    void dataFolders()
    {
        TestEnvironment env;
        const QString base = env.path(u"commonappdata/Brimvault/"_s);
        QCOMPARE(DataFolders::GamesFolder() + u'|' + DataFolders::IconsFolder() + u'|' + DataFolders::ReclamaFolder(),
            base + u'|' + base + u"Icons/|"_s + base + u"Reclama/"_s);
        qputenv("BRIMVAULT_COMMON_APPDATA", "   ");
        QCOMPARE(DataFolders::GamesFolder() + DataFolders::IconsFolder() + DataFolders::ReclamaFolder(), QString());
    }
};

BV_REGISTER_TEST(TestCatalogueStore);
#include "tst_cataloguestore.moc"
