#include "catalogue/GameAdder.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueFiles.h"
#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Pairs = QList<QPair<QString, QString>>;

class TestGameAdder : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ListBuilder> m_builder;
    std::unique_ptr<GameAdder> m_adder;

    static Pairs filesSection() { return GetAllSettings(AppTitle(), u"Files"_s); }
    static QString setting(const QString& key) { return GetSetting(AppTitle(), u"Files"_s, key); }
    QString tree(const QString& name = QString()) const { return m_env->path(u"tree/"_s + name); }
    bool writeTree(const QStringList& names) const
    {
        for (const QString& name : names)
            if (!WriteFile(tree(name)))
                return false;
        return true;
    }
    static QStringList pathsOf(const QList<GameEntry>& entries)
    {
        QStringList paths;
        for (const GameEntry& entry : entries)
            paths.append(entry.path);
        return paths;
    }

private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_builder = std::make_unique<ListBuilder>(DataFolders::IconsFolder());
        m_builder->beginPass();
        m_adder = std::make_unique<GameAdder>(*m_builder);
    }
    void cleanup()
    {
        m_adder.reset();
        m_builder.reset();
        m_env.reset();
    }

    void addFileOnce()
    {
        const QString game = tree(u"Chess.exe"_s);
        QVERIFY(WriteFile(game));
        const auto entry = m_adder->AddGameFile(game);
        QVERIFY(entry);
        QCOMPARE(entry->caption, u"Chess"_s);
        QCOMPARE(filesSection(), Pairs({{u"Count"_s, u"1"_s}, {u"File1"_s, game}}));
        QVERIFY(!m_adder->AddGameFile(u"  "_s + game.toUpper() + u" "_s));
        QCOMPARE(filesSection().size(), 2);
    }

    // Below the root first, each folder before its sub-folders; the stop-marked folder's own files are still
    // taken, nothing below it; the root comes last. One folder per level keeps the listing order out of it.
    void addFolderWalkOrder()
    {
        QVERIFY(writeTree({u"top.exe"_s, u"a/a.exe"_s, u"a/b/b.swf"_s, u"a/b/c/c.exe"_s, u"a/b/c/d/d.exe"_s}));
        QVERIFY(WriteStopMark(tree(u"a/b/c"_s), u"Yes"_s));
        QStringList sunk;
        const QList<GameEntry> added
            = m_adder->AddGamesFromFolder(tree(), [&sunk](const GameEntry& entry) { sunk.append(entry.path); });
        const QStringList expected {
            tree(u"a/a.exe"_s), tree(u"a/b/b.swf"_s), tree(u"a/b/c/c.exe"_s), tree(u"top.exe"_s)};
        QCOMPARE(pathsOf(added), expected);
        QCOMPARE(sunk, expected);
        QCOMPARE(filesSection(),
            Pairs({{u"File1"_s, expected.at(0)}, {u"File2"_s, expected.at(1)}, {u"File3"_s, expected.at(2)},
                {u"File4"_s, expected.at(3)}, {u"Count"_s, u"4"_s}}));
    }

    void addFolderFilters()
    {
        QVERIFY(writeTree({u"game.exe"_s, u"movie.SWF"_s, u"setup.exe"_s, u"Install.exe"_s, u"uninst.exe"_s, u"t.exe"_s,
            u"readme.txt"_s, u"page.htm"_s, u"Brimvault.exe"_s, u".hidden.exe"_s, u"listed.exe"_s}));
        m_builder->AddGameToList(tree(u"LISTED.EXE"_s).toUpper());
        const QStringList paths = pathsOf(m_adder->AddGamesFromFolder(tree()));
        QCOMPARE(QSet<QString>(paths.begin(), paths.end()), QSet<QString>({tree(u"game.exe"_s), tree(u"movie.SWF"_s)}));
        // A second scan finds everything listed and only rewrites the counter.
        QVERIFY(m_adder->AddGamesFromFolder(tree()).isEmpty());
        QCOMPARE(setting(u"Count"_s), u"2"_s);
        QCOMPARE(filesSection().size(), 3);
    }

    // The counter starts from the larger of itself and the highest number in use; a counter at the largest
    // number there is leaves the games the free numbers below it.
    void addFolderNumbers_data()
    {
        QTest::addColumn<QByteArray>("settings");
        QTest::addColumn<QStringList>("games");
        QTest::addColumn<Pairs>("expected");
        QTest::newRow("no settings file") << QByteArray() << QStringList() << Pairs {{u"Count"_s, u"0"_s}};
        QTest::newRow("nothing added keeps the counter")
            << QByteArray("[Files]\nCount=7\n") << QStringList() << Pairs {{u"Count"_s, u"7"_s}};
        QTest::newRow("counter below the highest number")
            << QByteArray("[Files]\nCount=2\nFile5=/old.exe\n") << QStringList {u"new.exe"_s}
            << Pairs {{u"Count"_s, u"6"_s}, {u"File5"_s, u"/old.exe"_s}, {u"File6"_s, u"new.exe"_s}};
        QTest::newRow("counter at the largest number")
            << QByteArray("[Files]\nCount=2147483647\nFile2=/old.exe\n") << QStringList {u"a/two.exe"_s, u"one.exe"_s}
            << Pairs {{u"Count"_s, u"2147483647"_s}, {u"File2"_s, u"/old.exe"_s}, {u"File1"_s, u"a/two.exe"_s},
                   {u"File3"_s, u"one.exe"_s}};
    }
    void addFolderNumbers()
    {
        QFETCH(QByteArray, settings);
        QFETCH(QStringList, games);
        QFETCH(Pairs, expected);
        if (!settings.isEmpty())
            QVERIFY(WriteFile(m_env->settingsFile(), settings));
        QVERIFY(writeTree(games << u"setup.exe"_s << u"readme.txt"_s));
        m_builder->beginPass();
        m_adder->AddGamesFromFolder(tree());
        for (const auto& [key, value] : expected)
            QCOMPARE(setting(key), key == u"Count" || value.startsWith(u'/') ? value : tree(value));
        QCOMPARE(filesSection().size(), expected.size());
    }

    void installerByVersionText()
    {
        REQUIRE_FIXTURE(CopyFixture(CatalogueFixture(u"setup_desc.exe"_s), tree(u"puzzles.exe"_s))
                && CopyFixture(PeFixture(u"multi64.exe"_s), tree(u"marble.exe"_s)),
            "the executable fixtures (mingw-w64)");
        const QList<GameEntry> added = m_adder->AddGamesFromFolder(tree());
        QCOMPARE(pathsOf(added), QStringList({tree(u"marble.exe"_s)}));
        QCOMPARE(added.first().caption, u"Marble Cascade"_s);
        // Chosen by hand or dropped, the same file is a game.
        const auto chosen = m_adder->AddGameFile(tree(u"puzzles.exe"_s));
        QVERIFY(chosen);
        QCOMPARE(chosen->caption, u"Puzzle Pack Setup Wizard"_s);
    }

    void drop_data()
    {
        QTest::addColumn<QStringList>("dropped");
        QTest::addColumn<QStringList>("added");
        QTest::newRow("executables, any case")
            << QStringList {u"a.exe"_s, u"b.EXE"_s} << QStringList {u"a.exe"_s, u"b.EXE"_s};
        QTest::newRow("flash movie and others refused")
            << QStringList {u"movie.swf"_s, u"readme.txt"_s, u"folder"_s, u"game.exe"_s} << QStringList {u"game.exe"_s};
        QTest::newRow("installer names accepted") << QStringList {u"setup.exe"_s} << QStringList {u"setup.exe"_s};
        QTest::newRow("same file twice") << QStringList {u"a.exe"_s, u"A.EXE"_s} << QStringList {u"a.exe"_s};
    }
    void drop()
    {
        QFETCH(QStringList, dropped);
        QFETCH(QStringList, added);
        QVERIFY(SaveSetting(AppTitle(), u"Files"_s, u"Count"_s, u"3"_s));
        m_builder->beginPass();
        QStringList files;
        for (const QString& name : dropped)
            files.append(tree(name));
        int sunk = 0;
        const QList<GameEntry> entries = m_adder->AddDroppedFiles(files, [&sunk](const GameEntry&) { ++sunk; });
        Pairs expected {{u"Count"_s, QString::number(3 + added.size())}};
        QStringList expectedPaths;
        for (qsizetype i = 0; i < added.size(); ++i) {
            expectedPaths.append(tree(added.at(i)));
            expected.append({u"File"_s + QString::number(4 + i), tree(added.at(i))});
        }
        QCOMPARE(pathsOf(entries), expectedPaths);
        QCOMPARE(sunk, int(added.size()));
        QCOMPARE(filesSection(), expected);
    }
};
BV_REGISTER_TEST(TestGameAdder);
#include "tst_gameadder.moc"
