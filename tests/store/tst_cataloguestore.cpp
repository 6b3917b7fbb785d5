#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/InfoFiles.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QtTest>

using namespace Brimvault;

namespace {

const QString files = QStringLiteral("Files");

QStringList keysOf(const QList<CatalogueStore::AddedGame>& games)
{
    QStringList keys;
    for (const auto& game : games)
        keys.append(game.key + u'=' + game.path);
    return keys;
}

} // namespace

class TestCatalogueStore : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void numbersAreNeverReused()
    {
        TestEnvironment env;
        QCOMPARE(CatalogueStore::AddGame(u"/g/one.exe"_qs), u"File1"_qs);
        QCOMPARE(CatalogueStore::AddGame(u"/g/two.exe"_qs), u"File2"_qs);
        QCOMPARE(CatalogueStore::AddGame(u"/g/three.swf"_qs), u"File3"_qs);
        CatalogueStore::SetDisplayName(u"File2"_qs, u"Second"_qs);
        CatalogueStore::SetDisplayName(u"file3"_qs, u"  Third "_qs);
        CatalogueStore::RemoveGame(u"File2"_qs);
        QCOMPARE(GetSetting(AppTitle(), u"FilesNames"_qs, u"FileName2"_qs, u"gone"_qs), u"gone"_qs);
        QCOMPARE(GetSetting(AppTitle(), u"FilesNames"_qs, u"FileName3"_qs), u"  Third "_qs);
        QCOMPARE(CatalogueStore::AddGame(u"/g/four.exe"_qs), u"File4"_qs);
        QCOMPARE(GetSetting(AppTitle(), files, u"Count"_qs), u"4"_qs);
        QCOMPARE(keysOf(CatalogueStore::AddedGames()),
            (QStringList {u"File1=/g/one.exe"_qs, u"File3=/g/three.swf"_qs, u"File4=/g/four.exe"_qs}));

        CatalogueStore::RemoveAllAddedGames();
        QVERIFY(CatalogueStore::AddedGames().isEmpty());
        QCOMPARE(CatalogueStore::EntryCount(), 0);
        QCOMPARE(CatalogueStore::DisplayName(u"FILE3"_qs), u"  Third "_qs);
    }

    // A counter edited by hand never makes a new game overwrite one that is still listed.
    void damagedCounter_data()
    {
        QTest::addColumn<QString>("count");
        QTest::addColumn<QStringList>("existing");
        QTest::addColumn<QString>("newKey");
        QTest::addColumn<QString>("countAfter");
        QTest::newRow("blanks around") << u" 7 "_qs << QStringList {} << u"File8"_qs << u"8"_qs;
        QTest::newRow("not a number") << u"abc"_qs << QStringList {u"File1"_qs, u"File2"_qs} << u"File3"_qs << u"3"_qs;
        QTest::newRow("missing") << QString() << QStringList {u"File5"_qs} << u"File6"_qs << u"6"_qs;
        QTest::newRow("too low") << u"1"_qs << QStringList {u"File1"_qs, u"file4"_qs} << u"File5"_qs << u"5"_qs;
        QTest::newRow("negative") << u"-3"_qs << QStringList {} << u"File1"_qs << u"1"_qs;
        // The largest number there is has been given out: the first free one is taken, the counter stays.
        QTest::newRow("counter at the largest number")
            << u"2147483647"_qs << QStringList {u"File1"_qs, u"File3"_qs} << u"File2"_qs << u"2147483647"_qs;
        QTest::newRow("entry at the largest number")
            << u"5"_qs << QStringList {u"File2147483647"_qs, u"File1"_qs} << u"File2"_qs << u"2147483647"_qs;
    }
    void damagedCounter()
    {
        QFETCH(QString, count);
        QFETCH(QStringList, existing);
        QFETCH(QString, newKey);
        QFETCH(QString, countAfter);
        TestEnvironment env;
        if (!count.isNull())
            SaveSetting(AppTitle(), files, u"Count"_qs, count);
        for (const QString& key : existing)
            SaveSetting(AppTitle(), files, key, u"/g/"_qs + key);
        QCOMPARE(CatalogueStore::AddGame(u"/g/new.exe"_qs), newKey);
        for (const QString& key : existing)
            QCOMPARE(GetSetting(AppTitle(), files, key), u"/g/"_qs + key);
        QCOMPARE(GetSetting(AppTitle(), files, u"Count"_qs), countAfter);
    }

    void counterIsSkipped_data()
    {
        QTest::addColumn<QString>("counterKey");
        QTest::addColumn<int>("entries");
        QTest::newRow("COUNT") << u"COUNT"_qs << 1;
        QTest::newRow("blanks") << u" count "_qs << 1;
        QTest::newRow("Counter is an entry") << u"Counter"_qs << 2;
    }
    void counterIsSkipped()
    {
        QFETCH(QString, counterKey);
        QFETCH(int, entries);
        TestEnvironment env;
        QVERIFY(WriteFile(env.settingsFile(), "[Files]\n" + counterKey.toUtf8() + "=1\nFile1=/g/a.exe\n"));
        QCOMPARE(CatalogueStore::AddedGames().size(), entries);
        QCOMPARE(keysOf(CatalogueStore::AddedGames()).last(), u"File1=/g/a.exe"_qs);
    }

    // Either lookup finds the first entry of a path, ignoring letter case and surrounding blanks.
    void pathLookup_data()
    {
        QTest::addColumn<QString>("lookedUp");
        QTest::addColumn<QString>("key");
        QTest::newRow("letter case") << u"c:\\games\\lines.exe"_qs << u"File2"_qs;
        QTest::newRow("blanks") << u"\tC:\\Games\\Lines.EXE  "_qs << u"File2"_qs;
        QTest::newRow("non-ASCII case") << u"/ИГРЫ/линии.EXE"_qs << u"File4"_qs;
        QTest::newRow("inner blank differs") << u"C:\\Games\\Li nes.exe"_qs << QString();
    }
    void pathLookup()
    {
        QFETCH(QString, lookedUp);
        QFETCH(QString, key);
        TestEnvironment env;
        for (const char* path : {"/g/first.exe", " C:\\Games\\Lines.EXE", "c:\\GAMES\\lines.exe", "/игры/Линии.exe"})
            CatalogueStore::AddGame(QString::fromUtf8(path));
        const auto game = CatalogueStore::FindAddedGame(lookedUp);
        QCOMPARE(game ? game->key : QString(), key);
        const auto index = CatalogueStore::IndexByPath(CatalogueStore::AddedGames());
        QCOMPARE(index.size(), 3);
        QCOMPARE(index.value(CatalogueStore::NormalisedPath(lookedUp)).key, key);
    }

    void gameInfoFileName_data()
    {
        QTest::addColumn<QString>("gamePath");
        QTest::addColumn<QString>("infoFile");
        QTest::newRow("Windows path") << u"C:\\Games\\foo.exe"_qs << u"C:\\Games\\foo.bvxinf"_qs;
        QTest::newRow("mixed separators") << u"C:\\Games/sub/x.y.exe"_qs << u"C:\\Games/sub/x.y.bvxinf"_qs;
        QTest::newRow("bare name") << u"foo.exe"_qs << u".\\foo.bvxinf"_qs;
        QTest::newRow("dot in folder only") << u"C:\\a.b\\file"_qs << u"C:\\a.b\\file.bvxinf"_qs;
        QTest::newRow("query cut first") << u"game.swf?x=1/2"_qs << u".\\game.bvxinf"_qs;
        QTest::newRow("address") << u"http://site/games/g.swf?id=3"_qs << u"http://site/games/g.bvxinf"_qs;
        QTest::newRow("root folder") << u"/x.exe"_qs << u"/x.bvxinf"_qs;
        QTest::newRow("name is extension only") << u"dir\\.hidden"_qs << u"dir\\.bvxinf"_qs;
    }
    void gameInfoFileName()
    {
        QFETCH(QString, gamePath);
        QFETCH(QString, infoFile);
        QCOMPARE(InfoFiles::GameInfoFileName(gamePath), infoFile);
    }

    void gameInfoName_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("lngNik");
        QTest::addColumn<QString>("name");
        const QByteArray both("<>Name<\xd0\x9b\xd0\xb8\xd0\xbd\xd0\xb8\xd0\xb8\r\n<>Name_ENG<Lines");
        QTest::newRow("only Name") << QByteArray("<>Name<Lines") << u"RUS"_qs << u"Lines"_qs;
        QTest::newRow("language record wins") << both << u"ENG"_qs << u"Lines"_qs;
        QTest::newRow("other language falls back") << both << u"RUS"_qs << u"Линии"_qs;
        QTest::newRow("blank language record")
            << QByteArray("<>Name_ENG<   \r\n<>Name<Default") << u"ENG"_qs << u"Default"_qs;
        QTest::newRow("trimmed") << QByteArray("<>Name<  Lines  \r\n") << u"ENG"_qs << u"Lines"_qs;
        QTest::newRow("key letter case") << QByteArray("<>NAME_eng<X") << u"ENG"_qs << u"X"_qs;
        QTest::newRow("escaped value") << QByteArray("<>Name<A \\{[}\\B\\{]}\\") << u"ENG"_qs << u"A <B>"_qs;
        QTest::newRow("no records") << QByteArray("just text") << u"ENG"_qs << QString();
    }
    void gameInfoName()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, lngNik);
        QFETCH(QString, name);
        TestEnvironment env;
        const QString folder = env.path(u"games/lines"_qs);
        QVERIFY(WriteFile(folder + u"/lines.bvxinf"_qs, content));
        QCOMPARE(InfoFiles::GameInfoName(folder + u"/lines.exe"_qs, lngNik), name);
        QCOMPARE(InfoFiles::GameInfoName(folder + u"/other.exe"_qs, lngNik), QString());
        // A folder where the info file would be is no info file.
        QVERIFY(QDir().mkpath(folder + u"/folder.bvxinf"_qs));
        QCOMPARE(InfoFiles::GameInfoName(folder + u"/folder.exe"_qs, lngNik), QString());
    }

    void stopFolder_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<bool>("stops");
        QTest::newRow("Yes with blanks") << QByteArray("<>StopDir<  Yes  ") << true;
        QTest::newRow("Yes, other records") << QByteArray("<>Other<1\r\n<>stopdir<Yes\r\n") << true;
        QTest::newRow("yes") << QByteArray("<>StopDir<yes") << false;
        QTest::newRow("No") << QByteArray("<>StopDir<No") << false;
        QTest::newRow("empty file") << QByteArray() << false;
    }
    void stopFolder()
    {
        QFETCH(QByteArray, content);
        QFETCH(bool, stops);
        TestEnvironment env;
        const QString folder = env.path(u"games/pack"_qs);
        QVERIFY(QDir().mkpath(folder));
        QVERIFY(!InfoFiles::IsStopFolder(folder));
        QVERIFY(WriteFile(folder + u"/DirInfo.bvxinf"_qs, content));
        QCOMPARE(InfoFiles::IsStopFolder(folder), stops);
        QCOMPARE(InfoFiles::IsStopFolder(folder + u'/'), stops);
        QCOMPARE(InfoFiles::IsStopFolder(folder + u'\\'), stops);
    }

    void dataFolders_data()
    {
        QTest::addColumn<QString>("commonAppData");
        QTest::newRow("present") << u"common"_qs;
        QTest::newRow("empty") << QString();
        QTest::newRow("blank") << u"   "_qs;
    }
    void dataFolders()
    {
        QFETCH(QString, commonAppData);
        TestEnvironment env;
        const QString root = commonAppData.trimmed().isEmpty() ? commonAppData : env.path(commonAppData);
        qputenv("BRIMVAULT_COMMON_APPDATA", root.toLocal8Bit());
        const QString base = root.trimmed().isEmpty() ? QString() : root + u"/Brimvault/"_qs;
        QCOMPARE(DataFolders::GamesFolder(), base);
        QCOMPARE(DataFolders::IconsFolder(), base.isEmpty() ? base : base + u"Icons/"_qs);
        QCOMPARE(DataFolders::ReclamaFolder(), base.isEmpty() ? base : base + u"Reclama/"_qs);
    }
};

BV_REGISTER_TEST(TestCatalogueStore);
#include "tst_cataloguestore.moc"
