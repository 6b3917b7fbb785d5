#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/InfoFiles.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"

#include <QDir>
#include <QFile>
#include <QtTest>

using namespace Brimvault;

class TestCatalogueStore : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void numbersAreNeverReused();
    void damagedCounter_data();
    void damagedCounter();
    void counterIsSkipped_data();
    void counterIsSkipped();
    void pathLookup_data();
    void pathLookup();
    void firstEntryWins();
    void displayNames();
    void removeAllKeepsDisplayNames();
    void gameInfoFileName_data();
    void gameInfoFileName();
    void gameInfoName_data();
    void gameInfoName();
    void stopFolder_data();
    void stopFolder();
    void dataFolders_data();
    void dataFolders();
};

namespace {

const QString files = QStringLiteral("Files");

void writeBytes(const QString& path, const QByteArray& bytes)
{
    QFile file(path);
    QVERIFY(file.open(QIODevice::WriteOnly));
    QCOMPARE(file.write(bytes), bytes.size());
}

QStringList keysOf(const QList<CatalogueStore::AddedGame>& games)
{
    QStringList keys;
    for (const auto& game : games)
        keys.append(game.key);
    return keys;
}

} // namespace

void TestCatalogueStore::numbersAreNeverReused()
{
    TestEnvironment env;
    QCOMPARE(CatalogueStore::EntryCount(), 0);
    QCOMPARE(CatalogueStore::AddGame(u"/g/one.exe"_qs), u"File1"_qs);
    QCOMPARE(CatalogueStore::AddGame(u"/g/two.exe"_qs), u"File2"_qs);
    QCOMPARE(CatalogueStore::AddGame(u"/g/three.swf"_qs), u"File3"_qs);
    CatalogueStore::SetDisplayName(u"File2"_qs, u"Second"_qs);
    CatalogueStore::SetDisplayName(u"File3"_qs, u"Third"_qs);

    CatalogueStore::RemoveGame(u"File2"_qs);
    QCOMPARE(GetSetting(AppTitle(), u"FilesNames"_qs, u"FileName2"_qs, u"gone"_qs), u"gone"_qs);
    QCOMPARE(CatalogueStore::DisplayName(u"File3"_qs), u"Third"_qs);
    QCOMPARE(CatalogueStore::AddGame(u"/g/four.exe"_qs), u"File4"_qs);

    QCOMPARE(GetSetting(AppTitle(), files, u"Count"_qs), u"4"_qs);
    QCOMPARE(CatalogueStore::EntryCount(), 4);
    const auto games = CatalogueStore::AddedGames();
    QCOMPARE(keysOf(games), (QStringList {u"File1"_qs, u"File3"_qs, u"File4"_qs}));
    QCOMPARE(games[1].path, u"/g/three.swf"_qs);
    QCOMPARE(games[1].number(), 3);
    QCOMPARE(games[2].path, u"/g/four.exe"_qs);
}

void TestCatalogueStore::damagedCounter_data()
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

// A counter edited by hand never makes a new game overwrite one that is still listed.
void TestCatalogueStore::damagedCounter()
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

void TestCatalogueStore::counterIsSkipped_data()
{
    QTest::addColumn<QString>("counterKey");
    QTest::addColumn<int>("entries");
    QTest::newRow("Count") << u"Count"_qs << 1;
    QTest::newRow("COUNT") << u"COUNT"_qs << 1;
    QTest::newRow("blanks") << u" count "_qs << 1;
    QTest::newRow("Counter is an entry") << u"Counter"_qs << 2;
}

void TestCatalogueStore::counterIsSkipped()
{
    QFETCH(QString, counterKey);
    QFETCH(int, entries);
    TestEnvironment env;
    writeBytes(env.settingsFile(), "[Files]\n" + counterKey.toUtf8() + "=1\nFile1=/g/a.exe\n");
    const auto games = CatalogueStore::AddedGames();
    QCOMPARE(games.size(), entries);
    QCOMPARE(games.last().key, u"File1"_qs);
    QCOMPARE(games.last().path, u"/g/a.exe"_qs);
}

void TestCatalogueStore::pathLookup_data()
{
    QTest::addColumn<QString>("stored");
    QTest::addColumn<QString>("lookedUp");
    QTest::addColumn<bool>("found");
    QTest::newRow("same") << u"/g/a.exe"_qs << u"/g/a.exe"_qs << true;
    QTest::newRow("letter case") << u"C:\\Games\\Lines.EXE"_qs << u"c:\\games\\lines.exe"_qs << true;
    QTest::newRow("blanks") << u"  /g/Game.swf "_qs << u"/g/game.swf\t"_qs << true;
    QTest::newRow("non-ASCII case") << u"/игры/Линии.exe"_qs << u"/ИГРЫ/линии.EXE"_qs << true;
    QTest::newRow("other file") << u"/g/a.exe"_qs << u"/g/b.exe"_qs << false;
    QTest::newRow("inner blank differs") << u"/g/a b.exe"_qs << u"/g/ab.exe"_qs << false;
}

void TestCatalogueStore::pathLookup()
{
    QFETCH(QString, stored);
    QFETCH(QString, lookedUp);
    QFETCH(bool, found);
    TestEnvironment env;
    CatalogueStore::AddGame(u"/g/first.exe"_qs);
    const QString key = CatalogueStore::AddGame(stored);
    const auto game = CatalogueStore::FindAddedGame(lookedUp);
    QCOMPARE(game.has_value(), found);
    const auto index = CatalogueStore::IndexByPath(CatalogueStore::AddedGames());
    const auto indexed = index.constFind(CatalogueStore::NormalisedPath(lookedUp));
    QCOMPARE(indexed != index.constEnd(), found);
    if (found) {
        QCOMPARE(game->key, key);
        QCOMPARE(game->path, stored);
        QCOMPARE(indexed->key, key);
    }
}

// The same game added twice is found under its first entry, by either lookup.
void TestCatalogueStore::firstEntryWins()
{
    TestEnvironment env;
    CatalogueStore::AddGame(u"/g/other.exe"_qs);
    CatalogueStore::AddGame(u"/g/Twice.exe"_qs);
    CatalogueStore::AddGame(u" /G/twice.exe"_qs);
    QCOMPARE(CatalogueStore::FindAddedGame(u"/g/twice.exe"_qs)->key, u"File2"_qs);
    const auto index = CatalogueStore::IndexByPath(CatalogueStore::AddedGames());
    QCOMPARE(index.size(), 2);
    QCOMPARE(index.value(u"/g/twice.exe"_qs).key, u"File2"_qs);
}

void TestCatalogueStore::displayNames()
{
    TestEnvironment env;
    QCOMPARE(CatalogueStore::DisplayNameKey(u"File12"_qs), u"FileName12"_qs);
    QCOMPARE(CatalogueStore::DisplayNameKey(u"file3"_qs), u"FileName3"_qs);
    QCOMPARE(CatalogueStore::DisplayName(u"File1"_qs), QString());
    CatalogueStore::SetDisplayName(u"File1"_qs, u"  My game  "_qs);
    QCOMPARE(GetSetting(AppTitle(), u"FilesNames"_qs, u"FileName1"_qs), u"  My game  "_qs);
    QCOMPARE(CatalogueStore::DisplayName(u"FILE1"_qs), u"  My game  "_qs);
}

void TestCatalogueStore::removeAllKeepsDisplayNames()
{
    TestEnvironment env;
    const QString key = CatalogueStore::AddGame(u"/g/a.exe"_qs);
    CatalogueStore::SetDisplayName(key, u"A"_qs);
    CatalogueStore::RemoveAllAddedGames();
    QVERIFY(CatalogueStore::AddedGames().isEmpty());
    QCOMPARE(CatalogueStore::EntryCount(), 0);
    QCOMPARE(CatalogueStore::DisplayName(key), u"A"_qs);
}

void TestCatalogueStore::gameInfoFileName_data()
{
    QTest::addColumn<QString>("gamePath");
    QTest::addColumn<QString>("infoFile");
    QTest::newRow("Windows path") << u"C:\\Games\\foo.exe"_qs << u"C:\\Games\\foo.bvxinf"_qs;
    QTest::newRow("slashes") << u"/home/u/games/foo.exe"_qs << u"/home/u/games/foo.bvxinf"_qs;
    QTest::newRow("mixed separators") << u"C:\\Games/sub/x.y.exe"_qs << u"C:\\Games/sub/x.y.bvxinf"_qs;
    QTest::newRow("bare name") << u"foo.exe"_qs << u".\\foo.bvxinf"_qs;
    QTest::newRow("no extension") << u"foo"_qs << u".\\foo.bvxinf"_qs;
    QTest::newRow("dot in folder only") << u"C:\\a.b\\file"_qs << u"C:\\a.b\\file.bvxinf"_qs;
    QTest::newRow("query cut first") << u"game.swf?x=1/2"_qs << u".\\game.bvxinf"_qs;
    QTest::newRow("address") << u"http://site/games/g.swf?id=3"_qs << u"http://site/games/g.bvxinf"_qs;
    QTest::newRow("root folder") << u"/x.exe"_qs << u"/x.bvxinf"_qs;
    QTest::newRow("name is extension only") << u"dir\\.hidden"_qs << u"dir\\.bvxinf"_qs;
}

void TestCatalogueStore::gameInfoFileName()
{
    QFETCH(QString, gamePath);
    QFETCH(QString, infoFile);
    QCOMPARE(InfoFiles::GameInfoFileName(gamePath), infoFile);
}

void TestCatalogueStore::gameInfoName_data()
{
    QTest::addColumn<QByteArray>("content");
    QTest::addColumn<QString>("lngNik");
    QTest::addColumn<QString>("name");
    const QByteArray both("<>Name<\xd0\x9b\xd0\xb8\xd0\xbd\xd0\xb8\xd0\xb8\r\n<>Name_ENG<Lines");
    QTest::newRow("only Name, ENG") << QByteArray("<>Name<Lines") << u"ENG"_qs << u"Lines"_qs;
    QTest::newRow("only Name, RUS") << QByteArray("<>Name<Lines") << u"RUS"_qs << u"Lines"_qs;
    QTest::newRow("language record wins") << both << u"ENG"_qs << u"Lines"_qs;
    QTest::newRow("other language falls back") << both << u"RUS"_qs << u"Линии"_qs;
    QTest::newRow("blank language record")
        << QByteArray("<>Name_ENG<   \r\n<>Name<Default") << u"ENG"_qs << u"Default"_qs;
    QTest::newRow("trimmed") << QByteArray("<>Name<  Lines  \r\n") << u"ENG"_qs << u"Lines"_qs;
    QTest::newRow("key letter case") << QByteArray("<>NAME_eng<X") << u"ENG"_qs << u"X"_qs;
    QTest::newRow("LF line end") << QByteArray("<>Name<Lines\n") << u"ENG"_qs << u"Lines"_qs;
    QTest::newRow("escaped value") << QByteArray("<>Name<A \\{[}\\B\\{]}\\") << u"ENG"_qs << u"A <B>"_qs;
    QTest::newRow("no records") << QByteArray("just text") << u"ENG"_qs << QString();
}

void TestCatalogueStore::gameInfoName()
{
    QFETCH(QByteArray, content);
    QFETCH(QString, lngNik);
    QFETCH(QString, name);
    TestEnvironment env;
    const QString folder = env.path(u"games/lines"_qs);
    QVERIFY(QDir().mkpath(folder));
    writeBytes(folder + u"/lines.bvxinf"_qs, content);
    QCOMPARE(InfoFiles::GameInfoName(folder + u"/lines.exe"_qs, lngNik), name);
    QCOMPARE(InfoFiles::GameInfoName(folder + u"/other.exe"_qs, lngNik), QString());
    // A folder where the info file would be is no info file.
    QVERIFY(QDir().mkpath(folder + u"/folder.bvxinf"_qs));
    QCOMPARE(InfoFiles::GameInfoName(folder + u"/folder.exe"_qs, lngNik), QString());
}

void TestCatalogueStore::stopFolder_data()
{
    QTest::addColumn<QByteArray>("content");
    QTest::addColumn<bool>("stops");
    QTest::newRow("Yes") << QByteArray("<>StopDir<Yes") << true;
    QTest::newRow("Yes with blanks") << QByteArray("<>StopDir<  Yes  ") << true;
    QTest::newRow("Yes with line end") << QByteArray("<>Other<1\r\n<>stopdir<Yes\r\n") << true;
    QTest::newRow("yes") << QByteArray("<>StopDir<yes") << false;
    QTest::newRow("YES") << QByteArray("<>StopDir<YES") << false;
    QTest::newRow("No") << QByteArray("<>StopDir<No") << false;
    QTest::newRow("empty value") << QByteArray("<>StopDir<") << false;
    QTest::newRow("empty file") << QByteArray() << false;
    QTest::newRow("garbage") << QByteArray("\xff\xfe<>StopDir<\x80Yes") << false;
}

void TestCatalogueStore::stopFolder()
{
    QFETCH(QByteArray, content);
    QFETCH(bool, stops);
    TestEnvironment env;
    const QString folder = env.path(u"games/pack"_qs);
    QVERIFY(QDir().mkpath(folder));
    QVERIFY(!InfoFiles::IsStopFolder(folder));
    writeBytes(folder + u"/DirInfo.bvxinf"_qs, content);
    QCOMPARE(InfoFiles::IsStopFolder(folder), stops);
    QCOMPARE(InfoFiles::IsStopFolder(folder + u'/'), stops);
    QCOMPARE(InfoFiles::IsStopFolder(folder + u'\\'), stops);
}

void TestCatalogueStore::dataFolders_data()
{
    QTest::addColumn<QString>("commonAppData");
    QTest::addColumn<bool>("present");
    QTest::newRow("present") << u"common"_qs << true;
    QTest::newRow("empty") << QString() << false;
    QTest::newRow("blank") << u"   "_qs << false;
}

void TestCatalogueStore::dataFolders()
{
    QFETCH(QString, commonAppData);
    QFETCH(bool, present);
    TestEnvironment env;
    const QString root = present ? env.path(commonAppData) : commonAppData;
    qputenv("BRIMVAULT_COMMON_APPDATA", root.toLocal8Bit());
    if (present) {
        QCOMPARE(DataFolders::GamesFolder(), root + u"/Brimvault/"_qs);
        QCOMPARE(DataFolders::IconsFolder(), root + u"/Brimvault/Icons/"_qs);
        QCOMPARE(DataFolders::ReclamaFolder(), root + u"/Brimvault/Reclama/"_qs);
    } else {
        QVERIFY(DataFolders::GamesFolder().isEmpty());
        QVERIFY(DataFolders::IconsFolder().isEmpty());
        QVERIFY(DataFolders::ReclamaFolder().isEmpty());
        QVERIFY(DataFolders::DataFolder(CatalogueKeys::GamesSubPath).isEmpty());
    }
}

QTEST_GUILESS_MAIN(TestCatalogueStore)
#include "tst_cataloguestore.moc"
