#include "gameactions/GameLauncher.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include "LaunchRecords.h"
#include "LocalHttpServer.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "UrlCatcher.h"

#include <QSignalSpy>

using namespace Brimvault;
using namespace Qt::StringLiterals;

// Games are copies of the launch recorder; the service beside the program is one too.
class TestGameLauncher : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<UrlCatcher> m_urls;
    QString m_savedFolder;
    QByteArray m_savedPath;

    QString root(const QString& relative) const { return m_env->path(relative); }
    QList<LaunchRecord> records(const QString& program) const { return ReadLaunchRecords(root(u"records"_s), program); }
    QString installGame(const QString& relative) const
    {
        return InstallRecorder(QStringLiteral(LAUNCH_RECORDER), root(relative)) ? root(relative) : QString();
    }
    QString write(const QString& relative, const QByteArray& bytes) const
    {
        return WriteFile(root(relative), bytes) ? root(relative) : QString();
    }

private Q_SLOTS:
    void init()
    {
        m_savedFolder = QDir::currentPath();
        m_savedPath = qgetenv("PATH");
        m_env = std::make_unique<TestEnvironment>();
        m_urls = std::make_unique<UrlCatcher>();
        QDir().mkpath(root(u"records"_s));
        qputenv("BV_LAUNCH_RECORD", root(u"records"_s).toLocal8Bit());
        qputenv("BRIMVAULT_PROGRAM_DIR", root(u"program"_s).toLocal8Bit());
        // Only our own folder on the PATH: a wine installed on this machine must not take part.
        qputenv("PATH", root(u"bin"_s).toLocal8Bit());
        QVERIFY(!installGame(u"program/BrimvaultService"_s).isEmpty());
    }
    void cleanup()
    {
        QDir::setCurrent(m_savedFolder);
        qputenv("PATH", m_savedPath);
        m_urls.reset();
        m_env.reset();
    }

    // Started in its own folder, which stays current; blanks in the path need no quotes; an item given
    // with blanks around is found all the same.
    void nativeGameStartsInItsOwnFolder_data()
    {
        QTest::addColumn<QString>("game");
        QTest::addColumn<bool>("offline");
        QTest::newRow("plain") << u"commonappdata/Brimvault/Lines/lines"_s << false;
        QTest::newRow("blanks, mixed case") << u"my games/Space Rocks/Space Rocks"_s << false;
        QTest::newRow("open game offline") << u"Games/Ball Game/ball game"_s << true;
    }
    void nativeGameStartsInItsOwnFolder()
    {
        QFETCH(QString, game);
        QFETCH(bool, offline);
        const QString path = installGame(game);
        QVERIFY(!path.isEmpty());
        GameLauncher launcher;
        QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
        if (offline)
            launcher.launchOffline(u"  "_s + path + u" "_s, QString());
        else
            launcher.launchItem(path, u"Caption"_s);
        const QString program = QFileInfo(path).fileName();
        QTRY_COMPARE(records(program).size(), 1);
        QCOMPARE(records(program).first().program, path);
        QCOMPARE(records(program).first().workingFolder, QFileInfo(path).absolutePath());
        QVERIFY(records(program).first().arguments.isEmpty());
        QCOMPARE(QDir::currentPath(), QFileInfo(path).absolutePath());
        QVERIFY(m_urls->opened.isEmpty());
        QCOMPARE(movies.count(), 0);
    }

    void browserOrProcess_data()
    {
        QTest::addColumn<QString>("item"); // "{root}" stands for the test's folder
        QTest::addColumn<QString>("openedUrl"); // empty: nothing goes to the browser
        QTest::newRow("page.HTM") << u"{root}/pages/page.HTM"_s << u"file://{root}/pages/page.HTM"_s;
        QTest::newRow("x.aspx") << u"{root}/pages/x.aspx"_s << u"file://{root}/pages/x.aspx"_s;
        QTest::newRow("mht") << u"{root}/pages/saved.mht"_s << u"file://{root}/pages/saved.mht"_s;
        QTest::newRow("asp query") << u"http://127.0.0.1:9/Play.ASP?game=5&x=1"_s
                                   << u"http://127.0.0.1:9/Play.ASP?game=5&x=1"_s;
        QTest::newRow("address without page") << u"https://127.0.0.1:9/games"_s << u"https://127.0.0.1:9/games"_s;
        QTest::newRow("x.ht is a process") << u"{root}/pages/x.ht"_s << QString();
        QTest::newRow("missing game") << u"{root}/nowhere/game"_s << QString();
    }
    void browserOrProcess()
    {
        QFETCH(QString, item);
        QFETCH(QString, openedUrl);
        for (const QString& page : {u"page.HTM"_s, u"x.aspx"_s, u"saved.mht"_s, u"x.ht"_s})
            QVERIFY(!write(u"pages/"_s + page, "<html></html>").isEmpty());
        GameLauncher launcher;
        QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
        launcher.launchItem(item.replace(u"{root}"_s, m_env->root()), QString());
        const QList<QUrl> expected {QUrl(openedUrl.replace(u"{root}"_s, m_env->root()))};
        QCOMPARE(m_urls->opened, openedUrl.isEmpty() ? QList<QUrl>() : expected);
        QCOMPARE(movies.count(), 0);
        // Web page or failed start, the service hears of the first launch all the same.
        QTRY_COMPARE(records(u"BrimvaultService"_s).size(), 1);
    }

    // A movie plays in a media host window of its own (trimmed caption), unless it is named like a catalogue
    // code and the catalogue server answers: then its article opens.
    void numberedMovie_data()
    {
        QTest::addColumn<QString>("movieName");
        QTest::addColumn<bool>("offline");
        QTest::addColumn<bool>("connected");
        QTest::addColumn<bool>("probed");
        QTest::addColumn<QString>("articleCode"); // empty: the movie plays locally
        const QString numbered = u"20071231235959000001"_s;
        QTest::newRow("online") << numbered + u".swf"_s << false << true << true << numbered;
        QTest::newRow("longer name, first 20") << numbered + u"77 Racer.swf"_s << false << true << true << numbered;
        QTest::newRow("middle not tested")
            << u"20xx-yy-zz game 0005.swf"_s << false << true << true << u"20xx-yy-zz game 0005"_s;
        QTest::newRow("open game offline") << numbered + u".swf"_s << true << true << false << QString();
        QTest::newRow("server unreachable") << numbered + u".swf"_s << false << false << true << QString();
        QTest::newRow("shorter than 20") << u"20abc.swf"_s << false << true << false << QString();
        QTest::newRow("20th not a digit") << u"200712312359590000xA.swf"_s << false << true << false << QString();
        QTest::newRow("not starting with 20") << u"19071231235959000001.swf"_s << false << true << false << QString();
    }
    void numberedMovie()
    {
        QFETCH(QString, movieName);
        QFETCH(bool, offline);
        QFETCH(bool, connected);
        QFETCH(QString, articleCode);
        const QString movie = write(u"Flash/"_s + movieName, "FWS");
        GameLauncher launcher;
        int probes = 0;
        launcher.setConnectionProbe([&probes, connected] { return ++probes, connected; });
        launcher.setCatalogueRoot([] { return u"http://127.0.0.1:9/"_s; });
        QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
        const QString caption = u"  "_s + movieName + u"  "_s;
        offline ? launcher.launchOffline(movie, caption) : launcher.launchItem(movie, caption);
        QFETCH(bool, probed);
        QCOMPARE(probes, probed ? 1 : 0);
        QCOMPARE(movies.count(), articleCode.isEmpty() ? 1 : 0);
        if (articleCode.isEmpty())
            QCOMPARE(movies.first(), QVariantList({movie, movieName}));
        const QList<QUrl> article {QUrl(u"http://127.0.0.1:9/OnlineGamesArticle.asp?code="_s + articleCode)};
        QCOMPARE(m_urls->opened, articleCode.isEmpty() ? QList<QUrl>() : article);
    }

    // Without a probe of its own the launcher asks the catalogue server itself.
    void articleAsksTheCatalogueServer()
    {
        LocalHttpServer server;
        QVERIFY(server.isListening());
        qputenv("BRIMVAULT_CATALOGUE_ROOT", server.root().toLocal8Bit());
        const QString movie = write(u"Flash/20071231235959000001.swf"_s, "FWS");
        GameLauncher launcher;
        launcher.launchItem(movie, u"Racer"_s);
        QCOMPARE(server.targets.size(), 1);
        QVERIFY(server.targets.first().startsWith(u"/GetBrimvaultConnection.asp?rnd="));
        QCOMPARE(m_urls->opened,
            QList<QUrl>({QUrl(server.root() + u"/OnlineGamesArticle.asp?code=20071231235959000001"_s)}));
    }

    // Once per run of the program (per launcher), even when the launch fails or the service is missing.
    void serviceSignalledOncePerRun()
    {
        const QString first = installGame(u"games/One/one"_s);
        GameLauncher launcher;
        QVERIFY(!launcher.serviceSignalled());
        launcher.launchItem(first, QString());
        QVERIFY(launcher.serviceSignalled());
        QTRY_COMPARE(records(u"BrimvaultService"_s).size(), 1);
        QCOMPARE(records(u"BrimvaultService"_s).first().program, root(u"program/BrimvaultService"_s));
        QCOMPARE(records(u"BrimvaultService"_s).first().arguments, QStringList {u"-R"_s});
        launcher.launchItem(root(u"games/Gone/gone"_s), QString());
        launcher.launchItem(first, QString());
        QTRY_COMPARE(records(u"one"_s).size(), 2);
        QTest::qWait(200);
        QCOMPARE(records(u"BrimvaultService"_s).size(), 1);

        GameLauncher nextRun;
        nextRun.launchItem(root(u"games/Gone/gone"_s), QString());
        QTRY_COMPARE(records(u"BrimvaultService"_s).size(), 2);
        QFile::remove(root(u"program/BrimvaultService"_s));
        GameLauncher withoutService;
        withoutService.launchItem(first, QString());
        QVERIFY(withoutService.serviceSignalled());
    }

    // No runner, or one named in the settings that is not there: the game fails silently, the service runs.
    void windowsGameThroughRunner_data()
    {
        QTest::addColumn<QString>("runnerSetting"); // "{root}" stands for the test's folder; null: not set
        QTest::addColumn<QString>("runnerFile"); // where the recorder stands in for the runner; "": none
        QTest::addColumn<QStringList>("runnerArguments"); // before the game's path
        QTest::newRow("setting with arguments") << u"\"{root}/runners/my runner\" --quiet -x"_s
                                                << u"runners/my runner"_s << QStringList {u"--quiet"_s, u"-x"_s};
        QTest::newRow("setting, name on PATH") << u"proton-run"_s << u"bin/proton-run"_s << QStringList();
        QTest::newRow("default wine on PATH") << QString() << u"bin/wine"_s << QStringList();
        QTest::newRow("blank setting is the default") << u"   "_s << u"bin/wine"_s << QStringList();
        QTest::newRow("no runner") << QString() << QString() << QStringList();
        QTest::newRow("runner missing") << u"no-such-runner-brimvault"_s << QString() << QStringList();
    }
    void windowsGameThroughRunner()
    {
        QFETCH(QString, runnerSetting);
        QFETCH(QString, runnerFile);
        QFETCH(QStringList, runnerArguments);
        QVERIFY(runnerFile.isEmpty() || !installGame(runnerFile).isEmpty());
        if (!runnerSetting.isNull())
            QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, u"CompatibilityRunner"_s,
                runnerSetting.replace(u"{root}"_s, m_env->root())));
        const QString game = write(u"Program Files/Card Games/sol.exe"_s, QByteArray("MZ\x90\x00", 4));
        GameLauncher launcher;
        QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
        launcher.launchItem(game, QString());
        QTRY_COMPARE(records(u"BrimvaultService"_s).size(), 1);
        QCOMPARE(movies.count(), 0);
        QVERIFY(m_urls->opened.isEmpty());
        if (runnerFile.isEmpty()) {
            QTest::qWait(200);
            QCOMPARE(QDir(root(u"records"_s)).entryList(QDir::Files), QStringList {u"BrimvaultService.record"_s});
            return;
        }
        const QString runner = QFileInfo(runnerFile).fileName();
        QTRY_COMPARE(records(runner).size(), 1);
        QCOMPARE(records(runner).first().program, root(runnerFile));
        QCOMPARE(records(runner).first().arguments, runnerArguments << game);
        QCOMPARE(records(runner).first().workingFolder, root(u"Program Files/Card Games"_s));
    }
};
BV_REGISTER_TEST(TestGameLauncher);
#include "tst_gamelauncher.moc"
