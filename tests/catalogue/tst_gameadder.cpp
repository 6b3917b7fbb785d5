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
    QString tree(const QString& name = QString()) const { return m_env->path(u"tree/"_s + name); }
    bool writeTree(const QStringList& names) const
    {
        return std::all_of(names.begin(), names.end(), [this](const QString& name) { return WriteFile(tree(name)); });
    }
    static QStringList pathsOf(const QList<GameEntry>& entries)
    {
        QStringList paths;
        for (const GameEntry& entry : entries)
            paths.append(entry.path);
        return paths;
    }
    void start(const QByteArray& settings)
    {
        QVERIFY(WriteFile(m_env->settingsFile(), settings));
        m_builder->beginPass();
    }

private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_builder = std::make_unique<ListBuilder>(DataFolders::IconsFolder());
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
        m_builder->beginPass();
        const QString game = tree(u"Chess.exe"_s);
        QVERIFY(WriteFile(game));
        const auto entry = m_adder->AddGameFile(game);
        QVERIFY(entry && entry->caption == u"Chess"_s);
        QCOMPARE(filesSection(), Pairs({{u"Count"_s, u"1"_s}, {u"File1"_s, game}}));
        QVERIFY(!m_adder->AddGameFile(u"  "_s + game.toUpper() + u" "_s));
        QCOMPARE(filesSection().size(), 2);
    }

    // Below the root first, each folder before its sub-folders; the stop-marked folder's own files are still
    // taken, nothing below it; the root comes last. One folder per level keeps the listing order out of it.
    // Numbers go on from the highest in use when the counter is below it.
    void addFolderWalkOrder()
    {
        start("[Files]\nCount=2\nFile5=/old.exe\n");
        QVERIFY(writeTree({u"top.exe"_s, u"a/a.exe"_s, u"a/b/b.swf"_s, u"a/b/c/c.exe"_s, u"a/b/c/d/d.exe"_s}));
        QVERIFY(WriteFile(tree(u"a/b/c/DirInfo.bvxinf"_s), "<>StopDir<Yes"));
        QStringList sunk;
        const QList<GameEntry> added
            = m_adder->AddGamesFromFolder(tree(), [&sunk](const GameEntry& entry) { sunk.append(entry.path); });
        const QStringList expected {
            tree(u"a/a.exe"_s), tree(u"a/b/b.swf"_s), tree(u"a/b/c/c.exe"_s), tree(u"top.exe"_s)};
        QCOMPARE(pathsOf(added), expected);
        QCOMPARE(sunk, expected);
        QCOMPARE(filesSection(),
            Pairs({{u"Count"_s, u"9"_s}, {u"File5"_s, u"/old.exe"_s}, {u"File6"_s, expected.at(0)},
                {u"File7"_s, expected.at(1)}, {u"File8"_s, expected.at(2)}, {u"File9"_s, expected.at(3)}}));
    }

    void addFolderFilters()
    {
        // A counter at the largest number there is leaves the games the free numbers.
        start("[Files]\nCount=2147483647\nFile2=/old.exe\n");
        QVERIFY(writeTree({u"game.exe"_s, u"movie.SWF"_s, u"setup.exe"_s, u"Install.exe"_s, u"uninst.exe"_s, u"t.exe"_s,
            u"readme.txt"_s, u"page.htm"_s, u"Brimvault.exe"_s, u".hidden.exe"_s, u"listed.exe"_s}));
        m_builder->AddGameToList(tree(u"LISTED.EXE"_s).toUpper());
        const QStringList paths = pathsOf(m_adder->AddGamesFromFolder(tree()));
        QCOMPARE(QSet<QString>(paths.begin(), paths.end()), QSet<QString>({tree(u"game.exe"_s), tree(u"movie.SWF"_s)}));
        // A second scan finds everything listed and only rewrites the counter.
        QVERIFY(m_adder->AddGamesFromFolder(tree()).isEmpty());
        const Pairs files = filesSection();
        QCOMPARE(files.mid(0, 2), Pairs({{u"Count"_s, u"2147483647"_s}, {u"File2"_s, u"/old.exe"_s}}));
        QCOMPARE(QSet<QString>({files.at(2).first, files.at(3).first}), QSet<QString>({u"File1"_s, u"File3"_s}));
        QCOMPARE(files.size(), 4);
    }

    void installerByVersionText()
    {
        m_builder->beginPass();
        REQUIRE_FIXTURE(CopyFixture(CatalogueFixture(u"setup_desc.exe"_s), tree(u"puzzles.exe"_s))
                && CopyFixture(PeFixture(u"multi64.exe"_s), tree(u"marble.exe"_s)),
            "the executable fixtures (mingw-w64)");
        const QList<GameEntry> added = m_adder->AddGamesFromFolder(tree());
        QCOMPARE(pathsOf(added), QStringList({tree(u"marble.exe"_s)}));
        QCOMPARE(added.first().caption, u"Marble Cascade"_s);
        // Chosen by hand or dropped, the same file is a game.
        const auto chosen = m_adder->AddGameFile(tree(u"puzzles.exe"_s));
        QVERIFY(chosen && chosen->caption == u"Puzzle Pack Setup Wizard"_s);
    }

    // Executables only, in any case, installers too, each file once.
    void drop()
    {
        start("[Files]\nCount=3\n");
        QStringList files;
        for (const char* name : {"a.exe", "b.EXE", "movie.swf", "readme.txt", "folder", "setup.exe", "A.EXE"})
            files.append(tree(QString::fromLatin1(name)));
        int sunk = 0;
        const QList<GameEntry> entries = m_adder->AddDroppedFiles(files, [&sunk](const GameEntry&) { ++sunk; });
        const QStringList added {tree(u"a.exe"_s), tree(u"b.EXE"_s), tree(u"setup.exe"_s)};
        QCOMPARE(pathsOf(entries), added);
        QCOMPARE(sunk, 3);
        QCOMPARE(filesSection(),
            Pairs({{u"Count"_s, u"6"_s}, {u"File4"_s, added.at(0)}, {u"File5"_s, added.at(1)},
                {u"File6"_s, added.at(2)}}));
    }
};
BV_REGISTER_TEST(TestGameAdder);
#include "tst_gameadder.moc"
