#include "gameactions/DeleteFolderTree.h"
#include "gameactions/GameRemoval.h"

#include "TestEnvironment.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"

#include <QTest>

using namespace Brimvault;

Q_DECLARE_METATYPE(RemovalOutcome)

class tst_GameRemoval : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();
    void removeInstalledGame_data();
    void removeInstalledGame();
    void noKeepsEverything();
    void linksAreNotFollowed();
    void addedGameIsForgottenNotDeleted();
    void removeAllAddedGames();
    void deleteFolderTreeTakesHiddenAndReadOnly();

private:
    QString games(const QString& relative = QString()) const { return DataFolders::GamesFolder() + relative; }
    void createFiles(const QStringList& relativePaths) const;
    QString settingsValue(const QLatin1String& section, const QString& key) const;

    std::unique_ptr<TestEnvironment> m_env;
    QList<PromptRequest> m_prompts;
    PromptAnswer m_answer = PromptAnswer::Yes;
};

void tst_GameRemoval::createFiles(const QStringList& relativePaths) const
{
    for (const QString& relative : relativePaths) {
        const QString path = games(relative);
        if (relative.endsWith(u'/')) {
            QVERIFY(QDir().mkpath(path));
            continue;
        }
        QVERIFY(QDir().mkpath(QFileInfo(path).absolutePath()));
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly));
        file.write("data");
    }
}

QString tst_GameRemoval::settingsValue(const QLatin1String& section, const QString& key) const
{
    return GetSetting(AppTitle(), section, key, QStringLiteral("<none>"));
}

void tst_GameRemoval::init()
{
    m_env = std::make_unique<TestEnvironment>();
    m_prompts.clear();
    m_answer = PromptAnswer::Yes;
    SetPromptHandler([this](const PromptRequest& request) {
        m_prompts.append(request);
        return request.buttons == PromptButtons::YesNo ? m_answer : PromptAnswer::Ok;
    });
}

void tst_GameRemoval::cleanup()
{
    SetPromptHandler({});
    m_env.reset();
}

void tst_GameRemoval::removeInstalledGame_data()
{
    QTest::addColumn<QStringList>("files"); // below the games folder; a trailing "/" makes a folder
    QTest::addColumn<QString>("item");
    QTest::addColumn<QStringList>("gone");
    QTest::addColumn<QStringList>("kept");
    QTest::addColumn<RemovalOutcome>("outcome");

    QTest::newRow("own folder") << QStringList {QStringLiteral("Lines/lines.exe"),
        QStringLiteral("Lines/Data/level1.dat"), QStringLiteral("Lines/.settings"), QStringLiteral("Other/other.exe")}
                                << QStringLiteral("Lines/lines.exe") << QStringList {QStringLiteral("Lines")}
                                << QStringList {QStringLiteral("Other/other.exe")} << RemovalOutcome::Removed;
    QTest::newRow("own folder, deeper") << QStringList {QStringLiteral("Pack/Lines/lines.exe"),
        QStringLiteral("Pack/readme.txt")}
                                        << QStringLiteral("Pack/Lines/lines.exe")
                                        << QStringList {QStringLiteral("Pack/Lines")}
                                        << QStringList {QStringLiteral("Pack/readme.txt")} << RemovalOutcome::Removed;
    QTest::newRow("own folder already gone")
        << QStringList {QStringLiteral("Other/other.exe")} << QStringLiteral("Gone/gone.exe") << QStringList()
        << QStringList {QStringLiteral("Other/other.exe")} << RemovalOutcome::Failed;
    QTest::newRow("loose files") << QStringList {QStringLiteral("lines.exe"), QStringLiteral("lines.bvxinf"),
        QStringLiteral("LINES.dat"), QStringLiteral("linesx.exe"), QStringLiteral("other.exe")}
                                 << QStringLiteral("lines.exe")
                                 << QStringList {QStringLiteral("lines.exe"), QStringLiteral("lines.bvxinf"),
                                        QStringLiteral("LINES.dat"), QStringLiteral("lines.exe.bak"),
                                        QStringLiteral("lines.bvxinf.bak")}
                                 << QStringList {QStringLiteral("linesx.exe"), QStringLiteral("other.exe")}
                                 << RemovalOutcome::Removed;
    QTest::newRow("loose files, no extension")
        << QStringList {QStringLiteral("lines"), QStringLiteral("lines.bvxinf"), QStringLiteral("linesx"),
               QStringLiteral("other")}
        << QStringLiteral("lines") << QStringList {QStringLiteral("lines"), QStringLiteral("lines.bvxinf")}
        << QStringList {QStringLiteral("linesx"), QStringLiteral("other")} << RemovalOutcome::Removed;
    // A file that cannot be moved aside (its ".bak" name is taken by a folder) brings back those already moved.
    QTest::newRow("loose files roll back")
        << QStringList {QStringLiteral("lines.bvxinf"), QStringLiteral("lines.dat"), QStringLiteral("lines.exe"),
               QStringLiteral("lines.exe.bak/keep.txt")}
        << QStringLiteral("lines.exe")
        << QStringList {QStringLiteral("lines.bvxinf.bak"), QStringLiteral("lines.dat.bak")}
        << QStringList {QStringLiteral("lines.bvxinf"), QStringLiteral("lines.dat"), QStringLiteral("lines.exe"),
               QStringLiteral("lines.exe.bak/keep.txt")}
        << RemovalOutcome::Failed;
    // A path that climbs out of the games folder is not an installed game: nothing is deleted.
    QTest::newRow("climbing out") << QStringList {QStringLiteral("Lines/lines.exe")}
                                  << QStringLiteral("Lines/../../outside/Game/game.exe") << QStringList()
                                  << QStringList {QStringLiteral("Lines/lines.exe"),
                                         QStringLiteral("../outside/Game/game.exe")}
                                  << RemovalOutcome::Removed;
}

void tst_GameRemoval::removeInstalledGame()
{
    QFETCH(QStringList, files);
    QFETCH(QString, item);
    QFETCH(QStringList, gone);
    QFETCH(QStringList, kept);
    QFETCH(RemovalOutcome, outcome);
    createFiles(files);
    createFiles({QStringLiteral("../outside/Game/game.exe")});
    // Renamed once, so the game also has an entry under "Files" and a display name.
    const QString key = CatalogueStore::AddGame(games(item).toUpper());
    CatalogueStore::SetDisplayName(key, QStringLiteral("My Lines"));

    QCOMPARE(AskAndRemoveGame(QStringLiteral("  Lines "), games(item)), outcome);

    QCOMPARE(m_prompts.first().text, QStringLiteral("Remove Lines?"));
    for (const QString& relative : gone)
        QVERIFY2(!QFileInfo::exists(games(relative)), qPrintable(relative));
    for (const QString& relative : kept)
        QVERIFY2(QFileInfo::exists(games(relative)), qPrintable(relative));
    if (outcome == RemovalOutcome::Removed) {
        QCOMPARE(m_prompts.size(), 1);
        QVERIFY(!CatalogueStore::FindAddedGame(games(item)));
        QCOMPARE(settingsValue(CatalogueKeys::FilesNamesSection, CatalogueStore::DisplayNameKey(key)),
            QStringLiteral("<none>"));
    } else {
        QCOMPARE(m_prompts.size(), 2);
        QCOMPARE(m_prompts.last().text, QStringLiteral("There was an error! The game isn't removed!"));
        QCOMPARE(m_prompts.last().icon, PromptIcon::Critical);
        QVERIFY(CatalogueStore::FindAddedGame(games(item)));
    }
}

void tst_GameRemoval::noKeepsEverything()
{
    createFiles({QStringLiteral("lines.exe"), QStringLiteral("Other/other.exe")});
    CatalogueStore::AddGame(games(QStringLiteral("Other/other.exe")));
    m_answer = PromptAnswer::No;

    QCOMPARE(AskAndRemoveGame(QStringLiteral("Lines"), games(QStringLiteral("lines.exe"))), RemovalOutcome::Cancelled);
    QCOMPARE(
        AskAndRemoveGame(QStringLiteral("Other"), games(QStringLiteral("Other/other.exe"))), RemovalOutcome::Cancelled);
    QVERIFY(QFileInfo::exists(games(QStringLiteral("lines.exe"))));
    QVERIFY(QFileInfo::exists(games(QStringLiteral("Other/other.exe"))));
    QVERIFY(CatalogueStore::FindAddedGame(games(QStringLiteral("Other/other.exe"))));
    QCOMPARE(m_prompts.first().title, QStringLiteral("Brimvault"));
    QCOMPARE(m_prompts.first().icon, PromptIcon::Question);
    QCOMPARE(m_prompts.first().buttons, PromptButtons::YesNo);
}

void tst_GameRemoval::linksAreNotFollowed()
{
    createFiles({QStringLiteral("Lines/lines.exe"), QStringLiteral("../precious/photo.jpg")});
    const QString precious = m_env->path(QStringLiteral("commonappdata/precious"));
    QVERIFY(QFile::link(precious, games(QStringLiteral("Lines/linked folder"))));
    QVERIFY(QFile::link(precious + QStringLiteral("/photo.jpg"), games(QStringLiteral("Lines/linked file"))));

    QCOMPARE(
        AskAndRemoveGame(QStringLiteral("Lines"), games(QStringLiteral("Lines/lines.exe"))), RemovalOutcome::Removed);
    QVERIFY(!QFileInfo::exists(games(QStringLiteral("Lines"))));
    QVERIFY(QFileInfo::exists(precious + QStringLiteral("/photo.jpg")));
}

void tst_GameRemoval::addedGameIsForgottenNotDeleted()
{
    const QString added = m_env->path(QStringLiteral("personal/My Games/Tetra/tetra"));
    QDir().mkpath(QFileInfo(added).absolutePath());
    QFile(added).open(QIODevice::WriteOnly);
    const QString first = CatalogueStore::AddGame(m_env->path(QStringLiteral("personal/first.exe")));
    const QString second = CatalogueStore::AddGame(QStringLiteral("  ") + added.toLower() + QStringLiteral(" "));
    const QString duplicate = CatalogueStore::AddGame(added);
    CatalogueStore::SetDisplayName(second, QStringLiteral("Tetra!"));
    CatalogueStore::SetDisplayName(first, QStringLiteral("First"));

    QCOMPARE(AskAndRemoveGame(QStringLiteral("Tetra!"), added), RemovalOutcome::Removed);

    QVERIFY(QFileInfo::exists(added));
    QCOMPARE(settingsValue(CatalogueKeys::FilesSection, second), QStringLiteral("<none>"));
    QCOMPARE(settingsValue(CatalogueKeys::FilesSection, duplicate), QStringLiteral("<none>"));
    QCOMPARE(settingsValue(CatalogueKeys::FilesNamesSection, CatalogueStore::DisplayNameKey(second)),
        QStringLiteral("<none>"));
    QCOMPARE(settingsValue(CatalogueKeys::FilesSection, first), m_env->path(QStringLiteral("personal/first.exe")));
    QCOMPARE(CatalogueStore::DisplayName(first), QStringLiteral("First"));
    // Numbers of removed entries are not given out again.
    QCOMPARE(CatalogueStore::EntryCount(), 3);
    QCOMPARE(CatalogueStore::AddGame(added), QStringLiteral("File4"));
}

void tst_GameRemoval::removeAllAddedGames()
{
    const QString key = CatalogueStore::AddGame(m_env->path(QStringLiteral("personal/a.exe")));
    CatalogueStore::AddGame(m_env->path(QStringLiteral("personal/b.swf")));
    CatalogueStore::SetDisplayName(key, QStringLiteral("Game A"));

    m_answer = PromptAnswer::No;
    QVERIFY(!AskAndRemoveAllAddedGames());
    QCOMPARE(CatalogueStore::AddedGames().size(), 2);
    QCOMPARE(m_prompts.last().text, QStringLiteral("Remove all added games?      "));
    QCOMPARE(m_prompts.last().buttons, PromptButtons::YesNo);

    m_answer = PromptAnswer::Yes;
    QVERIFY(AskAndRemoveAllAddedGames());
    QVERIFY(CatalogueStore::AddedGames().isEmpty());
    QCOMPARE(CatalogueStore::EntryCount(), 0);
    QCOMPARE(CatalogueStore::DisplayName(key), QStringLiteral("Game A"));
    QVERIFY(QFileInfo::exists(m_env->settingsFile()));

    // Nothing left to delete: no rebuild.
    QVERIFY(!AskAndRemoveAllAddedGames());
}

void tst_GameRemoval::deleteFolderTreeTakesHiddenAndReadOnly()
{
    createFiles({QStringLiteral("Tree/.hidden"), QStringLiteral("Tree/a/b/c/deep.txt"), QStringLiteral("Tree/empty/"),
        QStringLiteral("Tree/locked.txt")});
    QFile::setPermissions(games(QStringLiteral("Tree/locked.txt")), QFileDevice::ReadOwner);
    QVERIFY(DeleteFolderTree(games(QStringLiteral("Tree/"))));
    QVERIFY(!QFileInfo::exists(games(QStringLiteral("Tree"))));
    QVERIFY(QFileInfo::exists(games()));

    QVERIFY(!DeleteFolderTree(games(QStringLiteral("Missing"))));
    QVERIFY(!DeleteFolderTree(QString()));
    createFiles({QStringLiteral("plain.txt")});
    QVERIFY(!DeleteFolderTree(games(QStringLiteral("plain.txt"))));
    QVERIFY(QFileInfo::exists(games(QStringLiteral("plain.txt"))));
}

QTEST_GUILESS_MAIN(tst_GameRemoval)
#include "tst_gameremoval.moc"
