#include "catalogue/GameAdder.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueTestTree.h"
#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;
using namespace CatalogueTestTree;

using Pairs = QList<QPair<QString, QString>>;

class TestGameAdder : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void addFileOnce();
    void numbersAreNeverReused();
    void addFolderWalkOrder();
    void addFolderFilters();
    void addFolderRewritesCountWhenNothingAdded();
    void addFolderCountsFromTheHighestNumber();
    void addFolderAfterTheLargestNumber();
    void addFolderSkipsListedGames();
    void installerByVersionText();
    void drop_data();
    void drop();

private:
    static Pairs filesSection() { return GetAllSettings(AppTitle(), QStringLiteral("Files")); }
    static QString setting(const QString& key) { return GetSetting(AppTitle(), QStringLiteral("Files"), key); }
};

void TestGameAdder::initTestCase()
{
    modLocalizer::UseBuiltInLanguage();
}

void TestGameAdder::addFileOnce()
{
    TestEnvironment env;
    const QString game = env.path(QStringLiteral("games/Chess.exe"));
    QVERIFY(writeFile(game));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);

    const auto entry = adder.AddGameFile(game);
    QVERIFY(entry);
    QCOMPARE(entry->caption, QStringLiteral("Chess"));
    QCOMPARE(entry->path, game);
    QCOMPARE(filesSection(), Pairs({{u"Count"_qs, u"1"_qs}, {u"File1"_qs, game}}));

    QVERIFY(!adder.AddGameFile(u"  "_qs + game.toUpper() + u" "_qs));
    QCOMPARE(setting(u"Count"_qs), u"1"_qs);
    QCOMPARE(filesSection().size(), 2);
}

void TestGameAdder::numbersAreNeverReused()
{
    TestEnvironment env;
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    QStringList paths;
    for (const char* name : {"a.exe", "b.exe", "c.exe", "d.exe"})
        paths.append(env.path(QString::fromLatin1(name)));
    QCOMPARE(adder.RecordAddedGame(paths.at(0)), u"File1"_qs);
    QCOMPARE(adder.RecordAddedGame(paths.at(1)), u"File2"_qs);
    QCOMPARE(adder.RecordAddedGame(paths.at(2)), u"File3"_qs);
    QVERIFY(DeleteSetting(AppTitle(), u"Files"_qs, u"File2"_qs));
    QVERIFY(adder.AddGameFile(paths.at(3)));
    QCOMPARE(setting(u"File4"_qs), paths.at(3));
    QCOMPARE(setting(u"Count"_qs), u"4"_qs);
    QVERIFY(setting(u"File2"_qs).isEmpty());
}

void TestGameAdder::addFolderWalkOrder()
{
    TestEnvironment env;
    const QString root = env.path(QStringLiteral("tree"));
    // One folder per level keeps the file system's listing order out of the expected result.
    QVERIFY(writeFile(root + u"/top.exe"_qs));
    QVERIFY(writeFile(root + u"/a/a.exe"_qs));
    QVERIFY(writeFile(root + u"/a/b/b.swf"_qs));
    QVERIFY(writeFile(root + u"/a/b/c/c.exe"_qs));
    QVERIFY(writeFile(root + u"/a/b/c/d/d.exe"_qs));
    QVERIFY(writeStopMark(root + u"/a/b/c"_qs, u"Yes"_qs));

    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    QStringList sunk;
    const QList<GameEntry> added
        = adder.AddGamesFromFolder(root, [&sunk](const GameEntry& entry) { sunk.append(entry.path); });
    // Below the root first, each folder before its sub-folders; the stop-marked folder's own files are
    // still taken, nothing below it; the root comes last.
    const QStringList expected {
        root + u"/a/a.exe"_qs, root + u"/a/b/b.swf"_qs, root + u"/a/b/c/c.exe"_qs, root + u"/top.exe"_qs};
    QCOMPARE(pathsOf(added), expected);
    QCOMPARE(sunk, expected);
    QCOMPARE(filesSection(),
        Pairs({{u"File1"_qs, expected.at(0)}, {u"File2"_qs, expected.at(1)}, {u"File3"_qs, expected.at(2)},
            {u"File4"_qs, expected.at(3)}, {u"Count"_qs, u"4"_qs}}));
}

void TestGameAdder::addFolderFilters()
{
    TestEnvironment env;
    const QString root = env.path(QStringLiteral("tree/"));
    for (const char* name : {"game.exe", "movie.SWF", "setup.exe", "Install.exe", "uninst.exe", "t.exe", "readme.txt",
             "page.htm", "Brimvault.exe", ".hidden.exe"})
        QVERIFY(writeFile(root + QString::fromLatin1(name)));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    const QList<GameEntry> added = adder.AddGamesFromFolder(root);
    const QStringList paths = pathsOf(added);
    QCOMPARE(QSet<QString>(paths.begin(), paths.end()), QSet<QString>({root + u"game.exe"_qs, root + u"movie.SWF"_qs}));
    QCOMPARE(setting(u"Count"_qs), u"2"_qs);
}

void TestGameAdder::addFolderRewritesCountWhenNothingAdded()
{
    TestEnvironment env;
    const QString root = env.path(QStringLiteral("tree"));
    for (const char* name : {"setup.exe", "Install.exe", "uninst.exe", "readme.txt"})
        QVERIFY(writeFile(root + u"/"_qs + QString::fromLatin1(name)));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"Count"_qs, u"7"_qs));
    const QByteArray before = [&env] {
        QFile file(env.settingsFile());
        return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    }();
    QVERIFY(!before.isEmpty());
    QFile::remove(env.settingsFile());

    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    QVERIFY(adder.AddGamesFromFolder(root).isEmpty());
    QCOMPARE(filesSection(), Pairs({{u"Count"_qs, u"0"_qs}}));

    QVERIFY(writeFile(env.settingsFile(), before));
    QVERIFY(adder.AddGamesFromFolder(root).isEmpty());
    QCOMPARE(filesSection(), Pairs({{u"Count"_qs, u"7"_qs}}));
}

void TestGameAdder::addFolderCountsFromTheHighestNumber()
{
    TestEnvironment env;
    const QString root = env.path(QStringLiteral("tree"));
    QVERIFY(writeFile(root + u"/new.exe"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"Count"_qs, u"2"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"File5"_qs, env.path(QStringLiteral("old.exe"))));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    QCOMPARE(adder.AddGamesFromFolder(root).size(), 1);
    QCOMPARE(setting(u"File6"_qs), root + u"/new.exe"_qs);
    QCOMPARE(setting(u"File5"_qs), env.path(QStringLiteral("old.exe")));
    QCOMPARE(setting(u"Count"_qs), u"6"_qs);
}

// A counter edited up to the largest number there is: the games take the free numbers, nothing is overwritten.
void TestGameAdder::addFolderAfterTheLargestNumber()
{
    TestEnvironment env;
    const QString root = env.path(QStringLiteral("tree"));
    QVERIFY(writeFile(root + u"/one.exe"_qs));
    QVERIFY(writeFile(root + u"/two.exe"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"Count"_qs, u"2147483647"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"File2"_qs, env.path(QStringLiteral("old.exe"))));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    QCOMPARE(adder.AddGamesFromFolder(root).size(), 2);
    QCOMPARE(setting(u"File2"_qs), env.path(QStringLiteral("old.exe")));
    const QSet<QString> added {setting(u"File1"_qs), setting(u"File3"_qs)};
    QCOMPARE(added, QSet<QString>({root + u"/one.exe"_qs, root + u"/two.exe"_qs}));
    QCOMPARE(setting(u"Count"_qs), u"2147483647"_qs);
}

void TestGameAdder::addFolderSkipsListedGames()
{
    TestEnvironment env;
    const QString root = env.path(QStringLiteral("tree"));
    QVERIFY(writeFile(root + u"/listed.exe"_qs));
    QVERIFY(writeFile(root + u"/new.exe"_qs));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    builder.AddGameToList((root + u"/LISTED.EXE"_qs).toUpper());
    GameAdder adder(builder);
    QCOMPARE(pathsOf(adder.AddGamesFromFolder(root)), QStringList({root + u"/new.exe"_qs}));
    // A second scan of the same folder finds everything listed and only rewrites the counter.
    QVERIFY(adder.AddGamesFromFolder(root).isEmpty());
    QCOMPARE(filesSection(), Pairs({{u"File1"_qs, root + u"/new.exe"_qs}, {u"Count"_qs, u"1"_qs}}));
}

void TestGameAdder::installerByVersionText()
{
    TestEnvironment env;
    const QString fixture = catalogueFixture(QStringLiteral("setup_desc.exe"));
    const QString game = peFixture(QStringLiteral("multi64.exe"));
    if (fixture.isEmpty() || game.isEmpty())
        QSKIP("PE fixtures were not built");
    const QString root = env.path(QStringLiteral("tree/"));
    QVERIFY(copyFile(fixture, root + u"puzzles.exe"_qs));
    QVERIFY(copyFile(game, root + u"marble.exe"_qs));

    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    const QList<GameEntry> added = adder.AddGamesFromFolder(root);
    QCOMPARE(pathsOf(added), QStringList({root + u"marble.exe"_qs}));
    QCOMPARE(added.first().caption, QStringLiteral("Marble Cascade"));

    // Chosen by hand or dropped, the same file is a game.
    const auto chosen = adder.AddGameFile(root + u"puzzles.exe"_qs);
    QVERIFY(chosen);
    QCOMPARE(chosen->caption, QStringLiteral("Puzzle Pack Setup Wizard"));
    QCOMPARE(setting(u"File2"_qs), root + u"puzzles.exe"_qs);
}

void TestGameAdder::drop_data()
{
    QTest::addColumn<QStringList>("dropped");
    QTest::addColumn<QStringList>("added");
    QTest::newRow("three executables") << QStringList {u"a.exe"_qs, u"b.EXE"_qs, u"c.exe"_qs}
                                       << QStringList {u"a.exe"_qs, u"b.EXE"_qs, u"c.exe"_qs};
    QTest::newRow("flash movie refused") << QStringList {u"movie.swf"_qs} << QStringList {};
    QTest::newRow("others refused") << QStringList {u"readme.txt"_qs, u"folder"_qs, u"game.exe"_qs}
                                    << QStringList {u"game.exe"_qs};
    QTest::newRow("installer names accepted") << QStringList {u"setup.exe"_qs} << QStringList {u"setup.exe"_qs};
    QTest::newRow("same file twice") << QStringList {u"a.exe"_qs, u"A.EXE"_qs} << QStringList {u"a.exe"_qs};
}

void TestGameAdder::drop()
{
    QFETCH(QStringList, dropped);
    QFETCH(QStringList, added);
    TestEnvironment env;
    const QString folder = env.path(QStringLiteral("drop/"));
    QStringList files;
    for (const QString& name : dropped)
        files.append(folder + name);
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"Count"_qs, u"3"_qs));

    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    GameAdder adder(builder);
    int sunk = 0;
    const QList<GameEntry> entries = adder.AddDroppedFiles(files, [&sunk](const GameEntry&) { ++sunk; });
    QStringList expectedPaths;
    Pairs expectedSection {{u"Count"_qs, QString::number(3 + added.size())}};
    for (qsizetype i = 0; i < added.size(); ++i) {
        expectedPaths.append(folder + added.at(i));
        expectedSection.append({u"File"_qs + QString::number(4 + i), folder + added.at(i)});
    }
    QCOMPARE(pathsOf(entries), expectedPaths);
    QCOMPARE(sunk, int(added.size()));
    QCOMPARE(filesSection(), expectedSection);
}

QTEST_MAIN(TestGameAdder)
#include "tst_gameadder.moc"
