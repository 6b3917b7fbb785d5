#include "gameactions/DeleteFolderTree.h"
#include "gameactions/GameRemoval.h"

#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestGameRemoval : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<PromptRecorder> m_prompts;

    static QString games(const QString& relative = QString()) { return DataFolders::GamesFolder() + relative; }
    // Below the games folder; a trailing "/" makes a folder.
    static bool create(const QStringList& relatives)
    {
        for (const QString& relative : relatives)
            if (!(relative.endsWith(u'/') ? QDir().mkpath(games(relative)) : WriteFile(games(relative), "data")))
                return false;
        return true;
    }
    static bool exist(const QStringList& relatives, bool expected)
    {
        for (const QString& relative : relatives)
            if (QFileInfo::exists(games(relative)) != expected)
                return qWarning() << relative << "exists:" << !expected, false;
        return true;
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_prompts = std::make_unique<PromptRecorder>(PromptAnswer::Yes);
    }
    void cleanup()
    {
        m_prompts.reset();
        m_env.reset();
    }

    void removeInstalledGame_data()
    {
        QTest::addColumn<QStringList>("files");
        QTest::addColumn<QString>("item");
        QTest::addColumn<QStringList>("gone");
        QTest::addColumn<QStringList>("kept");
        QTest::addColumn<RemovalOutcome>("outcome");
        QTest::newRow("own folder") << QStringList {u"Lines/lines.exe"_s, u"Lines/Data/level1.dat"_s,
            u"Lines/.settings"_s, u"Other/other.exe"_s}
                                    << u"Lines/lines.exe"_s << QStringList {u"Lines"_s}
                                    << QStringList {u"Other/other.exe"_s} << RemovalOutcome::Removed;
        QTest::newRow("own folder, deeper")
            << QStringList {u"Pack/Lines/lines.exe"_s, u"Pack/readme.txt"_s} << u"Pack/Lines/lines.exe"_s
            << QStringList {u"Pack/Lines"_s} << QStringList {u"Pack/readme.txt"_s} << RemovalOutcome::Removed;
        QTest::newRow("own folder already gone")
            << QStringList {u"Other/other.exe"_s} << u"Gone/gone.exe"_s << QStringList()
            << QStringList {u"Other/other.exe"_s} << RemovalOutcome::Failed;
        QTest::newRow("loose files") << QStringList {u"lines.exe"_s, u"lines.bvxinf"_s, u"LINES.dat"_s, u"linesx.exe"_s,
            u"other.exe"_s} << u"lines.exe"_s
                                     << QStringList {u"lines.exe"_s, u"lines.bvxinf"_s, u"LINES.dat"_s,
                                            u"lines.exe.bak"_s, u"lines.bvxinf.bak"_s}
                                     << QStringList {u"linesx.exe"_s, u"other.exe"_s} << RemovalOutcome::Removed;
        QTest::newRow("loose files, no extension")
            << QStringList {u"lines"_s, u"lines.bvxinf"_s, u"linesx"_s, u"other"_s} << u"lines"_s
            << QStringList {u"lines"_s, u"lines.bvxinf"_s} << QStringList {u"linesx"_s, u"other"_s}
            << RemovalOutcome::Removed;
        // A file that cannot be moved aside (its ".bak" name is taken by a folder) brings back those already moved.
        QTest::newRow("loose files roll back")
            << QStringList {u"lines.bvxinf"_s, u"lines.dat"_s, u"lines.exe"_s, u"lines.exe.bak/keep.txt"_s}
            << u"lines.exe"_s << QStringList {u"lines.bvxinf.bak"_s, u"lines.dat.bak"_s}
            << QStringList {u"lines.bvxinf"_s, u"lines.dat"_s, u"lines.exe"_s, u"lines.exe.bak/keep.txt"_s}
            << RemovalOutcome::Failed;
        // A path that climbs out of the games folder is not an installed game: nothing is deleted.
        QTest::newRow("climbing out") << QStringList {u"Lines/lines.exe"_s} << u"Lines/../../outside/Game/game.exe"_s
                                      << QStringList()
                                      << QStringList {u"Lines/lines.exe"_s, u"../outside/Game/game.exe"_s}
                                      << RemovalOutcome::Removed;
    }
    void removeInstalledGame()
    {
        QFETCH(QStringList, files);
        QFETCH(QString, item);
        QFETCH(RemovalOutcome, outcome);
        QVERIFY(create(files << u"../outside/Game/game.exe"_s));
        // Renamed once, so the game also has an entry under "Files" and a display name.
        const QString key = CatalogueStore::AddGame(games(item).toUpper());
        CatalogueStore::SetDisplayName(key, u"My Lines"_s);

        QCOMPARE(AskAndRemoveGame(u"  Lines "_s, games(item)), outcome);
        QCOMPARE(m_prompts->prompts.first().text, u"Remove Lines?"_s);
        QFETCH(QStringList, gone);
        QFETCH(QStringList, kept);
        QVERIFY(exist(gone, false) && exist(kept, true));
        const bool removed = outcome == RemovalOutcome::Removed;
        QCOMPARE(bool(CatalogueStore::FindAddedGame(games(item))), !removed);
        QCOMPARE(CatalogueStore::DisplayName(key), removed ? QString() : u"My Lines"_s);
        QCOMPARE(m_prompts->texts().mid(1),
            removed ? QStringList() : QStringList {u"There was an error! The game isn't removed!"_s});
        QCOMPARE(m_prompts->prompts.last().icon, removed ? PromptIcon::Question : PromptIcon::Critical);
    }

    void noKeepsEverything()
    {
        QVERIFY(create({u"lines.exe"_s, u"Other/other.exe"_s}));
        CatalogueStore::AddGame(games(u"Other/other.exe"_s));
        m_prompts->answer = PromptAnswer::No;
        QCOMPARE(AskAndRemoveGame(u"Lines"_s, games(u"lines.exe"_s)), RemovalOutcome::Cancelled);
        QCOMPARE(AskAndRemoveGame(u"Other"_s, games(u"Other/other.exe"_s)), RemovalOutcome::Cancelled);
        QVERIFY(exist({u"lines.exe"_s, u"Other/other.exe"_s}, true));
        QVERIFY(CatalogueStore::FindAddedGame(games(u"Other/other.exe"_s)));
        QCOMPARE(m_prompts->prompts.first().title, u"Brimvault"_s);
        QCOMPARE(m_prompts->prompts.first().buttons, PromptButtons::YesNo);
    }

    void linksAreNotFollowed()
    {
        QVERIFY(create({u"Lines/lines.exe"_s, u"../precious/photo.jpg"_s}));
        const QString precious = m_env->path(u"commonappdata/precious"_s);
        QVERIFY(QFile::link(precious, games(u"Lines/linked folder"_s)));
        QVERIFY(QFile::link(precious + u"/photo.jpg"_s, games(u"Lines/linked file"_s)));
        QCOMPARE(AskAndRemoveGame(u"Lines"_s, games(u"Lines/lines.exe"_s)), RemovalOutcome::Removed);
        QVERIFY(!QFileInfo::exists(games(u"Lines"_s)));
        QVERIFY(QFileInfo::exists(precious + u"/photo.jpg"_s));
    }

    // Every entry of the path (trimmed, any case) is forgotten, with its name; the file stays.
    void addedGameIsForgottenNotDeleted()
    {
        const QString added = m_env->path(u"personal/My Games/Tetra/tetra"_s);
        QVERIFY(WriteFile(added));
        const QString first = CatalogueStore::AddGame(m_env->path(u"personal/first.exe"_s));
        const QString second = CatalogueStore::AddGame(u"  "_s + added.toLower() + u" "_s);
        CatalogueStore::AddGame(added);
        CatalogueStore::SetDisplayName(second, u"Tetra!"_s);
        CatalogueStore::SetDisplayName(first, u"First"_s);
        QCOMPARE(AskAndRemoveGame(u"Tetra!"_s, added), RemovalOutcome::Removed);
        QVERIFY(QFileInfo::exists(added));
        QCOMPARE(GetAllSettings(AppTitle(), CatalogueKeys::FilesSection),
            (QList<QPair<QString, QString>> {
                {u"Count"_s, u"3"_s}, {u"File1"_s, m_env->path(u"personal/first.exe"_s)}}));
        QCOMPARE(GetAllSettings(AppTitle(), CatalogueKeys::FilesNamesSection),
            (QList<QPair<QString, QString>> {{u"FileName1"_s, u"First"_s}}));
    }

    // Removing all added games keeps their display names and the settings file.
    void removeAllAddedGames()
    {
        const QString key = CatalogueStore::AddGame(m_env->path(u"personal/a.exe"_s));
        CatalogueStore::AddGame(m_env->path(u"personal/b.swf"_s));
        CatalogueStore::SetDisplayName(key, u"Game A"_s);
        m_prompts->answer = PromptAnswer::No;
        QVERIFY(!AskAndRemoveAllAddedGames());
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        QCOMPARE(m_prompts->prompts.last().text, u"Remove all added games?      "_s);
        QCOMPARE(m_prompts->prompts.last().buttons, PromptButtons::YesNo);
        m_prompts->answer = PromptAnswer::Yes;
        QVERIFY(AskAndRemoveAllAddedGames());
        QVERIFY(CatalogueStore::AddedGames().isEmpty());
        QCOMPARE(CatalogueStore::DisplayName(key), u"Game A"_s);
        // Nothing left to delete: no rebuild.
        QVERIFY(!AskAndRemoveAllAddedGames());
    }

    void deleteFolderTree()
    {
        QVERIFY(create(
            {u"Tree/.hidden"_s, u"Tree/a/b/c/deep.txt"_s, u"Tree/empty/"_s, u"Tree/locked.txt"_s, u"plain.txt"_s}));
        QFile::setPermissions(games(u"Tree/locked.txt"_s), QFileDevice::ReadOwner);
        QVERIFY(DeleteFolderTree(games(u"Tree/"_s)));
        QVERIFY(exist({u"Tree"_s}, false) && exist({QString(), u"plain.txt"_s}, true));
        QVERIFY(!DeleteFolderTree(games(u"Missing"_s)));
        QVERIFY(!DeleteFolderTree(QString()));
        QVERIFY(!DeleteFolderTree(games(u"plain.txt"_s)));
        QVERIFY(exist({u"plain.txt"_s}, true));
    }
};
BV_REGISTER_TEST(TestGameRemoval);
#include "tst_gameremoval.moc"
