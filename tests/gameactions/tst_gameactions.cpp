#include "gameactions/DeleteFolderTree.h"
#include "gameactions/GameLauncher.h"
#include "gameactions/GameRemoval.h"
#include "gameactions/GameRenaming.h"
#include "gameactions/LaunchRules.h"
#include "gameactions/PackageInstallCommand.h"
#include "gameactions/PlayTimeWatcher.h"
#include "gameactions/ServiceSignal.h"

#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"

#include "LaunchRecords.h"
#include "LocalHttpServer.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "UrlCatcher.h"

#include <QElapsedTimer>
#include <QSignalSpy>
#include <QTest>
#include <algorithm>

using namespace Brimvault;
using namespace Qt::StringLiterals;

using Settings = QList<QPair<QString, QString>>;

// Games, runners and the service beside the program are copies of the launch recorder.
class TestGameActions : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<UrlCatcher> m_urls;
    std::unique_ptr<PromptRecorder> m_prompts;
    QString m_savedFolder = QDir::currentPath();
    QByteArray m_savedPath = qgetenv("PATH");

    QString root(const QString& relative) const { return m_env->path(relative); }
    QList<LaunchRecord> records(const QString& program) const { return ReadLaunchRecords(root(u"records"_s), program); }
    bool install(const QString& relative) const
    {
        return InstallRecorder(QStringLiteral(LAUNCH_RECORDER), root(relative));
    }
    static QString games(const QString& relative) { return DataFolders::GamesFolder() + relative; }
    static bool create(const QStringList& relatives)
    {
        return std::ranges::all_of(
            relatives, [](const QString& relative) { return WriteFile(games(relative), "data"); });
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_urls = std::make_unique<UrlCatcher>();
        m_prompts = std::make_unique<PromptRecorder>();
        QVERIFY(QDir().mkpath(root(u"records"_s)) && install(u"program/BrimvaultService"_s));
        qputenv("BV_LAUNCH_RECORD", root(u"records"_s).toLocal8Bit());
        m_env->programDir();
        // Only our own folder on the PATH: a wine installed on this machine must not take part.
        qputenv("PATH", root(u"bin"_s).toLocal8Bit());
    }
    void cleanup()
    {
        QDir::setCurrent(m_savedFolder);
        qputenv("PATH", m_savedPath);
        qunsetenv("BV_LAUNCH_EXIT");
        qunsetenv("BV_LAUNCH_SECONDS");
        m_prompts.reset();
        m_urls.reset();
        m_env.reset();
    }

    void launchRules_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<LaunchKind>("kind");
        QTest::addColumn<QString>("articleCode");
        const LaunchKind web = LaunchKind::WebPage, movie = LaunchKind::FlashMovie, process = LaunchKind::Process;
        const QString code = u"20071231235959000001"_s;
        QTest::newRow("htm") << u"/g/page.HTM"_s << web << QString();
        QTest::newRow("php") << u"/g/game.php"_s << web << QString();
        QTest::newRow("asp query, any case") << u"/g/start?Page.ASP?id=1"_s << web << QString();
        QTest::newRow("address") << u" HTTPS://127.0.0.1:9/games"_s << web << QString();
        QTest::newRow("ht") << u"/g/x.ht"_s << process << QString();
        QTest::newRow("numbered movie") << u"/f/20071231235959000001.SWF"_s << movie << code;
        QTest::newRow("longer name, first 20") << u"/f/2007123123595900000177 Racer.swf"_s << movie << code;
        QTest::newRow("shorter than 20") << u"/f/2007123123595900001.swf"_s << movie << QString();
        QTest::newRow("20th not a digit") << u"/f/200712312359590000xA.swf"_s << movie << QString();
        QTest::newRow("not starting with 20") << u"/f/19071231235959000001.swf"_s << movie << QString();
    }
    void launchRules()
    {
        QFETCH(QString, path);
        QTEST(LaunchKindOf(path), "kind");
        QTEST(ArticleCode(path), "articleCode");
    }

    // "{root}" stands for the test's folder, "{server}" for the catalogue server, which is asked only about a
    // numbered movie, whose article then opens instead of the movie.
    void launchItem_data()
    {
        QTest::addColumn<QString>("item");
        QTest::addColumn<bool>("offline");
        QTest::addColumn<bool>("serverUp");
        QTest::addColumn<QString>("opened"); // null: the movie plays in a media host window
        QTest::addColumn<int>("asked");
        const QString movie = u"{root}/20071231235959000001.swf"_s;
        const QString article = u"{server}/OnlineGamesArticle.asp?code=20071231235959000001"_s;
        QTest::newRow("page") << u"{root}/page.htm"_s << false << true << u"file://{root}/page.htm"_s << 0;
        QTest::newRow("numbered movie") << movie << false << true << article << 1;
        QTest::newRow("open game offline") << movie << true << true << QString() << 0;
        QTest::newRow("server unreachable") << movie << false << false << QString() << 0;
        QTest::newRow("other movie") << u"{root}/Racer.swf"_s << false << true << QString() << 0;
    }
    void launchItem()
    {
        QFETCH(QString, item);
        QFETCH(bool, offline);
        QFETCH(QString, opened);
        QFETCH(bool, serverUp);
        LocalHttpServer server;
        QVERIFY(server.isListening());
        if (serverUp)
            qputenv("BRIMVAULT_CATALOGUE_ROOT", server.root().toLocal8Bit());
        GameLauncher launcher;
        QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
        QVERIFY(WriteFile(item.replace(u"{root}"_s, m_env->root())));
        // The service hears of the launcher's first launch, even a failed one, and of that one only.
        launcher.launchItem(root(u"gone"_s), QString());
        offline ? launcher.launchOffline(u" "_s + item + u" "_s, u" Racer  "_s)
                : launcher.launchItem(item, u" Racer  "_s);
        QTEST(int(server.targets.size()), "asked");
        QCOMPARE(QList<QVariantList>(movies),
            (opened.isNull() ? QList<QVariantList> {{item, u"Racer"_s}} : QList<QVariantList>()));
        opened.replace(u"{root}"_s, m_env->root()).replace(u"{server}"_s, server.root());
        QCOMPARE(m_urls->opened, opened.isNull() ? QList<QUrl>() : QList<QUrl> {QUrl(opened)});
        QTRY_VERIFY(!records(u"BrimvaultService"_s).isEmpty());
        QTest::qWait(200);
        const QList<LaunchRecord> service = records(u"BrimvaultService"_s);
        QCOMPARE(service.size(), 1);
        QCOMPARE(QStringList(service.first().arguments) << service.first().program,
            (QStringList {u"-R"_s, root(u"program/BrimvaultService"_s)}));
    }

    // A Windows game starts in its own folder, which stays current, through the runner of the settings (with
    // its own arguments), a blank setting meaning the default; blanks in the game's path need no quotes. The
    // launch does not wait: the play time is added when the process ends.
    void startProcess_data()
    {
        QTest::addColumn<QString>("setting"); // "{root}" stands for the test's folder
        QTest::addColumn<QString>("runner");
        QTest::addColumn<QStringList>("arguments"); // the runner's, before the game's path
        QTest::newRow("setting with arguments") << u" \"{root}/runners/my runner\" --quiet -x"_s
                                                << u"runners/my runner"_s << QStringList {u"--quiet"_s, u"-x"_s};
        QTest::newRow("blank setting is the default") << u"   "_s << u"bin/wine"_s << QStringList();
    }
    void startProcess()
    {
        QFETCH(QString, setting);
        QFETCH(QString, runner);
        QFETCH(QStringList, arguments);
        const QString game = root(u"Program Files/Card Games/sol.exe"_s);
        QVERIFY(install(runner) && WriteFile(game));
        QVERIFY(SaveSetting(
            AppTitle(), u"Settings"_s, u"CompatibilityRunner"_s, setting.replace(u"{root}"_s, m_env->root())));
        qputenv("BV_LAUNCH_SECONDS", "1");
        GameLauncher launcher;
        QSignalSpy ended(launcher.playTime(), &PlayTimeWatcher::ended);
        launcher.launchItem(game.toUpper(), QString());
        const QString folder = root(u"Program Files/Card Games"_s);
        QCOMPARE(QDir::currentPath(), folder);
        QCOMPARE(PlayHistory::Read(game).launches, 1);
        QCOMPARE(PlayHistory::Read(game).playSeconds, 0);
        QVERIFY(ended.wait(20000));
        const qint64 seconds = ended.first().at(1).toLongLong();
        QVERIFY2(seconds >= 1 && seconds < 20, qPrintable(QString::number(seconds)));
        QCOMPARE(PlayHistory::Read(game).playSeconds, seconds);
        const QList<LaunchRecord> started = records(QFileInfo(runner).fileName());
        QCOMPARE(started.size(), 1);
        QCOMPARE(QStringList({started.first().program, started.first().workingFolder}) + started.first().arguments,
            QStringList({root(runner), folder}) + arguments << game);
    }

    // Success only means the service ended, whatever its exit code; its record is there at once.
    void packageInstallRunsTheServiceToItsEnd()
    {
        qputenv("BV_LAUNCH_EXIT", "42");
        const QString package = root(u"My Downloads/say \"hi\".bvxpak"_s);
        QVERIFY(InstallGamePackage(package));
        QVERIFY(m_prompts->prompts.isEmpty());
        QCOMPARE(records(u"BrimvaultService"_s).size(), 1);
        QCOMPARE(records(u"BrimvaultService"_s).first().arguments, (QStringList {u"-I"_s, package}));
        InstallFolderMemory memory;
        QCOMPARE(memory.dialogFolder(), root(u"personal"_s));
        memory.packageChosen(package);
        QCOMPARE(memory.dialogFolder(), root(u"My Downloads/"_s));
    }

    // Only the exact text "1" is the signal; the watcher takes it every three seconds, by writing "0".
    void newGameInstalledSignal()
    {
        QVERIFY(!TakeNewGameInstalledSignal());
        QVERIFY(GetAllSettings(AppTitle(), u"Commands"_s).isEmpty());
        for (const QString& stored : {u" 1 "_s, u"01"_s}) {
            QVERIFY(SaveSetting(AppTitle(), u"Commands"_s, u"NewGameInstalled"_s, stored));
            QVERIFY(!TakeNewGameInstalledSignal());
        }
        ServiceSignalWatcher watcher;
        QSignalSpy rebuilds(&watcher, &ServiceSignalWatcher::rebuildRequested);
        QElapsedTimer clock;
        clock.start();
        QVERIFY(SaveSetting(AppTitle(), u"Commands"_s, u"NewGameInstalled"_s, u"1"_s));
        QTRY_COMPARE_WITH_TIMEOUT(rebuilds.count(), 1, 6000);
        QVERIFY(clock.elapsed() >= 2700); // coarse timers may tick up to 5% early
        QCOMPARE(GetSetting(AppTitle(), u"Commands"_s, u"NewGameInstalled"_s), u"0"_s);
    }

    // A file that cannot be moved aside (its ".bak" name is taken by a folder) brings back those already moved.
    // A path outside the games folder, even one climbing out of it, is only forgotten: nothing is deleted.
    void removeGame_data()
    {
        QTest::addColumn<QString>("files"); // in the games folder, separated by blanks
        QTest::addColumn<QString>("item");
        QTest::addColumn<QString>("after"); // what the games folder holds afterwards
        QTest::addColumn<bool>("removed");
        QTest::newRow("own folder") << u"Pack/Lines/lines.exe Pack/Lines/.settings Pack/Lines/Data/1.dat Pack/read.me"_s
                                    << u"Pack/Lines/lines.exe"_s << u"Pack/ Pack/read.me"_s << true;
        QTest::newRow("loose files") << u"lines.exe lines.bvxinf LINES.dat linesx.exe other.exe"_s << u"lines.exe"_s
                                     << u"linesx.exe other.exe"_s << true;
        QTest::newRow("loose file without extension")
            << u"lines lines.bvxinf linesx other"_s << u"lines"_s << u"linesx other"_s << true;
        QTest::newRow("loose files roll back")
            << u"lines.bvxinf lines.dat lines.exe lines.exe.bak/keep"_s << u"lines.exe"_s
            << u"lines.bvxinf lines.dat lines.exe lines.exe.bak/ lines.exe.bak/keep"_s << false;
        QTest::newRow("climbing out") << u"Lines/lines.exe"_s << u"Lines/../../outside/Game/game.exe"_s
                                      << u"Lines/ Lines/lines.exe"_s << true;
    }
    void removeGame()
    {
        QFETCH(QString, files);
        QFETCH(QString, item);
        QFETCH(bool, removed);
        QVERIFY(create(files.split(u' ') << u"../outside/Game/game.exe"_s));
        // Added twice (letter case and blanks differ) and renamed; another added game stays.
        const QString key = CatalogueStore::AddGame(games(item).toUpper());
        CatalogueStore::SetDisplayName(key, u"My Lines"_s);
        CatalogueStore::AddGame(u"  "_s + games(item).toLower());
        CatalogueStore::AddGame(root(u"other.exe"_s));
        QCOMPARE(
            AskAndRemoveGame(u"  Lines "_s, games(item)), removed ? RemovalOutcome::Removed : RemovalOutcome::Failed);
        QTEST(SnapshotTree(games(QString())).keys().join(u' '), "after");
        QVERIFY(QFileInfo::exists(games(u"../outside/Game/game.exe"_s)));
        QCOMPARE(m_prompts->texts(),
            QStringList {u"Remove Lines?"_s}
                + (removed ? QStringList() : QStringList {u"There was an error! The game isn't removed!"_s}));
        QCOMPARE(m_prompts->prompts.last().icon, removed ? PromptIcon::Question : PromptIcon::Critical);
        QCOMPARE(m_prompts->prompts.first().title, u"Brimvault"_s);
        QCOMPARE(CatalogueStore::AddedGames().size(), removed ? 1 : 3);
        QCOMPARE(CatalogueStore::DisplayName(key), removed ? QString() : u"My Lines"_s);
    }

    // Links are removed, never followed; hidden and read-only files go too.
    void deleteFolderTree()
    {
        QVERIFY(create({u"Tree/.hidden"_s, u"Tree/a/b/deep"_s, u"Tree/locked"_s, u"plain"_s, u"../precious/photo"_s})
            && QDir().mkpath(games(u"Tree/empty"_s)));
        QVERIFY(QFile::link(games(u"../precious"_s), games(u"Tree/linked folder"_s)));
        QVERIFY(QFile::link(games(u"../precious/photo"_s), games(u"Tree/linked file"_s)));
        QVERIFY(QFile::setPermissions(games(u"Tree/locked"_s), QFileDevice::ReadOwner));
        QVERIFY(DeleteFolderTree(games(u"Tree/"_s)));
        QVERIFY(!DeleteFolderTree(games(u"Missing"_s)) && !DeleteFolderTree(QString())
            && !DeleteFolderTree(games(u"plain"_s)));
        QCOMPARE(SnapshotTree(games(QString())).keys(), QStringList {u"plain"_s});
        QVERIFY(QFileInfo::exists(games(u"../precious/photo"_s)));
    }

    // Answered No, nothing goes. Removing all added games keeps their display names; with none left there is
    // nothing to rebuild.
    void removeAllAddedGames()
    {
        const QString game = root(u"a.exe"_s), all = u"Remove all added games?      "_s;
        CatalogueStore::SetDisplayName(CatalogueStore::AddGame(game), u"Game A"_s);
        m_prompts->answer = PromptAnswer::No;
        QVERIFY(!AskAndRemoveAllAddedGames());
        QCOMPARE(AskAndRemoveGame(u"Game A"_s, game), RemovalOutcome::Cancelled);
        m_prompts->answer = PromptAnswer::Yes;
        QVERIFY(AskAndRemoveAllAddedGames());
        QVERIFY(!AskAndRemoveAllAddedGames());
        QCOMPARE(m_prompts->texts(), (QStringList {all, u"Remove Game A?"_s, all, all}));
        QCOMPARE(m_prompts->prompts.first().buttons, PromptButtons::YesNo);
        QVERIFY(CatalogueStore::AddedGames().isEmpty());
        QCOMPARE(GetAllSettings(AppTitle(), u"FilesNames"_s), (Settings {{u"FileName1"_s, u"Game A"_s}}));
    }

    // The first entry of the path (matched trimmed, in any case) takes the name; a later duplicate does not. A
    // discovered game becomes an added one under its upper-cased path, found again by the next renaming.
    // Cancelled, answered empty or a web entry (not even asked about): nothing is stored.
    void renameGame()
    {
        CatalogueStore::AddGame(u"/games/a.exe"_s);
        CatalogueStore::AddGame(u" /Games/Tetra/tetra.swf "_s);
        CatalogueStore::AddGame(u"/games/tetra/TETRA.SWF"_s);
        for (const std::optional<QString>& answer : {std::optional<QString>(), std::optional(QString())}) {
            m_prompts->inputText = answer;
            QVERIFY(!AskAndRenameGame(u"  Tetra  "_s, u"/games/x.exe"_s));
        }
        m_prompts->inputText = u"Web"_s;
        QVERIFY(!AskAndRenameGame(u"Web"_s, u"  Https://127.0.0.1:9/"_s));
        for (const QString& name : {u"Falling Blocks"_s, u"Patience"_s, u"Klondike"_s}) {
            m_prompts->inputText = name;
            QCOMPARE(AskAndRenameGame(u"Tetra"_s,
                         name == u"Falling Blocks" ? u"/games/tetra/tetra.swf"_s : u"/windows/system32/sol.exe"_s),
                std::optional(name));
        }
        QCOMPARE(m_prompts->inputs.size(), 5);
        const InputRequest asked = m_prompts->inputs.first();
        QCOMPARE(QStringList({asked.prompt, asked.title, asked.defaultText}),
            QStringList({u"Edit game name"_s, u"Brimvault"_s, u"Tetra"_s}));
        QCOMPARE(GetSetting(AppTitle(), u"Files"_s, u"File4"_s), u"/WINDOWS/SYSTEM32/SOL.EXE"_s);
        QCOMPARE(GetAllSettings(AppTitle(), u"FilesNames"_s),
            (Settings {{u"FileName2"_s, u"Falling Blocks"_s}, {u"FileName4"_s, u"Klondike"_s}}));
        QCOMPARE(CatalogueStore::EntryCount(), 4);
    }
};
QTEST_MAIN(TestGameActions)
#include "tst_gameactions.moc"
