#include "gameactions/GameLauncher.h"

#include "LaunchRecords.h"
#include "TestEnvironment.h"
#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include <QDesktopServices>
#include <QSignalSpy>
#include <QTcpServer>
#include <QTcpSocket>
#include <QTest>
#include <QUrl>

using namespace Brimvault;

class tst_GameLauncher : public QObject {
    Q_OBJECT

public Q_SLOTS:
    void recordOpenedUrl(const QUrl& url) { m_openedUrls.append(url); }

private Q_SLOTS:
    void initTestCase();
    void cleanupTestCase();
    void init();
    void cleanup();

    void nativeGameStartsInItsOwnFolder_data();
    void nativeGameStartsInItsOwnFolder();
    void openGameOfflineFindsUpperCasedPath();
    void browserOrProcess_data();
    void browserOrProcess();
    void flashMovieGoesToMediaHost();
    void numberedMovie_data();
    void numberedMovie();
    void articleNeedsCatalogueServerToAnswer200_data();
    void articleNeedsCatalogueServerToAnswer200();
    void serviceSignalledOncePerRun();
    void failedLaunchStillSignalsService();
    void windowsGameThroughRunner_data();
    void windowsGameThroughRunner();
    void withoutRunnerWindowsGameFailsSilently();

private:
    QString root(const QString& relative) const { return m_env->path(relative); }
    QString records() const { return root(QStringLiteral("records")); }
    QString installGame(const QString& relative);
    QString writeFile(const QString& relative, const QByteArray& content);

    std::unique_ptr<TestEnvironment> m_env;
    QList<QUrl> m_openedUrls;
    QString m_savedFolder;
    QByteArray m_savedPath;
};

QString tst_GameLauncher::installGame(const QString& relative)
{
    const QString path = root(relative);
    return InstallRecorder(QStringLiteral(LAUNCH_RECORDER), path) ? path : QString();
}

QString tst_GameLauncher::writeFile(const QString& relative, const QByteArray& content)
{
    const QString path = root(relative);
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(content) != content.size())
        return QString();
    return path;
}

void tst_GameLauncher::initTestCase()
{
    for (const char* scheme : {"http", "https", "file"})
        QDesktopServices::setUrlHandler(QString::fromLatin1(scheme), this, "recordOpenedUrl");
    m_savedPath = qgetenv("PATH");
}

void tst_GameLauncher::cleanupTestCase()
{
    for (const char* scheme : {"http", "https", "file"})
        QDesktopServices::unsetUrlHandler(QString::fromLatin1(scheme));
}

void tst_GameLauncher::init()
{
    m_savedFolder = QDir::currentPath();
    m_env = std::make_unique<TestEnvironment>();
    m_openedUrls.clear();
    QDir().mkpath(records());
    qputenv("BV_LAUNCH_RECORD", records().toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_DIR", root(QStringLiteral("program")).toLocal8Bit());
    // Only our own folder on the PATH: a wine installed on this machine must not take part.
    qputenv("PATH", root(QStringLiteral("bin")).toLocal8Bit());
    QVERIFY(installGame(QStringLiteral("program/BrimvaultService")).size() > 0);
}

void tst_GameLauncher::cleanup()
{
    QDir::setCurrent(m_savedFolder);
    qputenv("PATH", m_savedPath);
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
    qunsetenv("BV_LAUNCH_RECORD");
    m_env.reset();
}

void tst_GameLauncher::nativeGameStartsInItsOwnFolder_data()
{
    QTest::addColumn<QString>("game");
    QTest::newRow("plain") << QStringLiteral("commonappdata/Brimvault/Lines/lines");
    QTest::newRow("blanks, unquoted") << QStringLiteral("my games/Space Rocks/space rocks");
    QTest::newRow("mixed case") << QStringLiteral("Games/MixedCase/Game");
}

void tst_GameLauncher::nativeGameStartsInItsOwnFolder()
{
    QFETCH(QString, game);
    const QString path = installGame(game);
    QVERIFY(!path.isEmpty());

    GameLauncher launcher;
    QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
    launcher.launchItem(path, QStringLiteral("Caption"));

    const QString program = QFileInfo(path).fileName();
    QTRY_COMPARE(ReadLaunchRecords(records(), program).size(), 1);
    const LaunchRecord record = ReadLaunchRecords(records(), program).first();
    QCOMPARE(record.program, path);
    QCOMPARE(record.workingFolder, QFileInfo(path).absolutePath());
    QVERIFY(record.arguments.isEmpty());
    // The game's folder stays current after the launch.
    QCOMPARE(QDir::currentPath(), QFileInfo(path).absolutePath());
    QVERIFY(m_openedUrls.isEmpty());
    QCOMPARE(movies.count(), 0);
}

void tst_GameLauncher::openGameOfflineFindsUpperCasedPath()
{
    const QString path = installGame(QStringLiteral("Games/Ball Game/ball game"));
    GameLauncher launcher;
    launcher.launchOffline(QStringLiteral("  ") + path + QStringLiteral(" "), QString());

    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("ball game")).size(), 1);
    const LaunchRecord record = ReadLaunchRecords(records(), QStringLiteral("ball game")).first();
    QCOMPARE(record.program, path);
    QCOMPARE(record.workingFolder, root(QStringLiteral("Games/Ball Game")));
}

void tst_GameLauncher::browserOrProcess_data()
{
    QTest::addColumn<QString>("item"); // "{root}" stands for the test's folder
    QTest::addColumn<QString>("openedUrl"); // empty: nothing goes to the browser

    QTest::newRow("page.HTM") << QStringLiteral("{root}/pages/page.HTM")
                              << QStringLiteral("file://{root}/pages/page.HTM");
    QTest::newRow("x.aspx") << QStringLiteral("{root}/pages/x.aspx") << QStringLiteral("file://{root}/pages/x.aspx");
    QTest::newRow("mht") << QStringLiteral("{root}/pages/saved.mht") << QStringLiteral("file://{root}/pages/saved.mht");
    QTest::newRow("asp query") << QStringLiteral("http://127.0.0.1:9/Play.ASP?game=5&x=1")
                               << QStringLiteral("http://127.0.0.1:9/Play.ASP?game=5&x=1");
    QTest::newRow("catalogue page") << QStringLiteral("http://127.0.0.1:9/online-games-catalog.asp")
                                    << QStringLiteral("http://127.0.0.1:9/online-games-catalog.asp");
    QTest::newRow("address without page")
        << QStringLiteral("https://127.0.0.1:9/games") << QStringLiteral("https://127.0.0.1:9/games");
    QTest::newRow("x.ht is a process") << QStringLiteral("{root}/pages/x.ht") << QString();
    QTest::newRow("missing game") << QStringLiteral("{root}/nowhere/game") << QString();
}

void tst_GameLauncher::browserOrProcess()
{
    QFETCH(QString, item);
    QFETCH(QString, openedUrl);
    for (const QString& page : {QStringLiteral("pages/page.HTM"), QStringLiteral("pages/x.aspx"),
             QStringLiteral("pages/saved.mht"), QStringLiteral("pages/x.ht")})
        QVERIFY(!writeFile(page, "<html></html>").isEmpty());
    item.replace(QStringLiteral("{root}"), m_env->root());
    openedUrl.replace(QStringLiteral("{root}"), m_env->root());

    GameLauncher launcher;
    QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
    launcher.launchItem(item, QString());

    if (openedUrl.isEmpty())
        QVERIFY(m_openedUrls.isEmpty());
    else
        QCOMPARE(m_openedUrls, QList<QUrl> {QUrl(openedUrl)});
    QCOMPARE(movies.count(), 0);
    // Web page or failed start, the service hears of the first launch all the same.
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).size(), 1);
}

void tst_GameLauncher::flashMovieGoesToMediaHost()
{
    const QString movie = writeFile(QStringLiteral("Flash/Jumper.swf"), "FWS");
    GameLauncher launcher;
    QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);

    launcher.launchItem(movie, QStringLiteral("  Jumper  "));
    QCOMPARE(movies.count(), 1);
    QCOMPARE(movies.at(0).at(0).toString(), movie);
    QCOMPARE(movies.at(0).at(1).toString(), QStringLiteral("Jumper"));

    // Every launch asks for a window of its own.
    launcher.launchOffline(movie, QStringLiteral("Jumper"));
    QCOMPARE(movies.count(), 2);
    QCOMPARE(movies.at(1).at(0).toString(), movie);
    QVERIFY(m_openedUrls.isEmpty());
}

void tst_GameLauncher::numberedMovie_data()
{
    QTest::addColumn<QString>("movieName");
    QTest::addColumn<bool>("offline");
    QTest::addColumn<bool>("connected");
    QTest::addColumn<bool>("probed"); // whether the catalogue server is asked at all
    QTest::addColumn<QString>("articleCode"); // empty: the movie plays locally

    const QString numbered = QStringLiteral("20071231235959000001");
    QTest::newRow("online") << numbered + QStringLiteral(".swf") << false << true << true << numbered;
    QTest::newRow("longer name, first 20")
        << numbered + QStringLiteral("77 Racer.swf") << false << true << true << numbered;
    QTest::newRow("middle not tested") << QStringLiteral("20xx-yy-zz game 0005.swf") << false << true << true
                                       << QStringLiteral("20xx-yy-zz game 0005");
    QTest::newRow("open game offline") << numbered + QStringLiteral(".swf") << true << true << false << QString();
    QTest::newRow("server unreachable") << numbered + QStringLiteral(".swf") << false << false << true << QString();
    QTest::newRow("shorter than 20") << QStringLiteral("20abc.swf") << false << true << false << QString();
    QTest::newRow("20th not a digit") << QStringLiteral("200712312359590000xA.swf") << false << true << false
                                      << QString();
    QTest::newRow("not starting with 20")
        << QStringLiteral("19071231235959000001.swf") << false << true << false << QString();
}

void tst_GameLauncher::numberedMovie()
{
    QFETCH(QString, movieName);
    QFETCH(bool, offline);
    QFETCH(bool, connected);
    QFETCH(bool, probed);
    QFETCH(QString, articleCode);
    const QString movie = writeFile(QStringLiteral("Flash/") + movieName, "FWS");

    GameLauncher launcher;
    int probes = 0;
    launcher.setConnectionProbe([&probes, connected] {
        ++probes;
        return connected;
    });
    launcher.setCatalogueRoot([] { return QStringLiteral("http://127.0.0.1:9/"); });
    QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
    if (offline)
        launcher.launchOffline(movie, movieName);
    else
        launcher.launchItem(movie, movieName);

    QCOMPARE(probes, probed ? 1 : 0);
    if (articleCode.isEmpty()) {
        QCOMPARE(movies.count(), 1);
        QVERIFY(m_openedUrls.isEmpty());
    } else {
        QCOMPARE(movies.count(), 0);
        QCOMPARE(m_openedUrls,
            QList<QUrl> {QUrl(QStringLiteral("http://127.0.0.1:9/OnlineGamesArticle.asp?code=") + articleCode)});
    }
}

void tst_GameLauncher::articleNeedsCatalogueServerToAnswer200_data()
{
    QTest::addColumn<QByteArray>("statusLine");
    QTest::addColumn<bool>("articleOpened");
    QTest::newRow("200") << QByteArray("200 OK") << true;
    QTest::newRow("302") << QByteArray("302 Found\r\nLocation: /elsewhere") << false;
    QTest::newRow("304") << QByteArray("304 Not Modified") << false;
    QTest::newRow("500") << QByteArray("500 Internal Server Error") << false;
}

void tst_GameLauncher::articleNeedsCatalogueServerToAnswer200()
{
    QFETCH(QByteArray, statusLine);
    QFETCH(bool, articleOpened);

    QTcpServer server;
    QVERIFY(server.listen(QHostAddress::LocalHost));
    QList<QByteArray> requests;
    connect(&server, &QTcpServer::newConnection, this, [&] {
        QTcpSocket* socket = server.nextPendingConnection();
        connect(socket, &QTcpSocket::readyRead, socket, [&requests, socket, statusLine] {
            const QByteArray request = socket->readAll();
            if (!request.contains("\r\n\r\n"))
                return;
            requests.append(request.left(request.indexOf("\r\n")));
            socket->write("HTTP/1.1 " + statusLine + "\r\nContent-Length: 0\r\nConnection: close\r\n\r\n");
            socket->disconnectFromHost();
        });
    });
    const QString serverRoot = QStringLiteral("http://127.0.0.1:%1").arg(server.serverPort());
    qputenv("BRIMVAULT_CATALOGUE_ROOT", serverRoot.toLocal8Bit());
    const QString code = QStringLiteral("20071231235959000001");
    const QString movie = writeFile(QStringLiteral("Flash/") + code + QStringLiteral(".swf"), "FWS");

    GameLauncher launcher;
    QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
    launcher.launchItem(movie, QStringLiteral("Racer"));

    QCOMPARE(requests.size(), 1);
    QVERIFY(requests.first().startsWith("GET /GetBrimvaultConnection.asp?rnd="));
    if (articleOpened) {
        QCOMPARE(m_openedUrls, QList<QUrl> {QUrl(serverRoot + QStringLiteral("/OnlineGamesArticle.asp?code=") + code)});
        QCOMPARE(movies.count(), 0);
    } else {
        QVERIFY(m_openedUrls.isEmpty());
        QCOMPARE(movies.count(), 1);
    }
}

void tst_GameLauncher::serviceSignalledOncePerRun()
{
    const QString first = installGame(QStringLiteral("games/One/one"));
    const QString second = installGame(QStringLiteral("games/Two/two"));
    GameLauncher launcher;
    QVERIFY(!launcher.serviceSignalled());

    launcher.launchItem(first, QString());
    QVERIFY(launcher.serviceSignalled());
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).size(), 1);
    const LaunchRecord service = ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).first();
    QCOMPARE(service.program, root(QStringLiteral("program/BrimvaultService")));
    QCOMPARE(service.arguments, QStringList {QStringLiteral("-R")});

    launcher.launchItem(second, QString());
    launcher.launchItem(first, QString());
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("two")).size(), 1);
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("one")).size(), 2);
    QTest::qWait(200);
    QCOMPARE(ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).size(), 1);

    // A new run of the program (a new main window) signals again.
    GameLauncher nextRun;
    nextRun.launchItem(first, QString());
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).size(), 2);
}

void tst_GameLauncher::failedLaunchStillSignalsService()
{
    GameLauncher launcher;
    launcher.launchItem(root(QStringLiteral("games/Gone/gone")), QString());
    QVERIFY(launcher.serviceSignalled());
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).size(), 1);

    // Without a service executable the launch is just as silent.
    QFile::remove(root(QStringLiteral("program/BrimvaultService")));
    GameLauncher another;
    another.launchItem(root(QStringLiteral("games/Gone/gone")), QString());
    QVERIFY(another.serviceSignalled());
}

void tst_GameLauncher::windowsGameThroughRunner_data()
{
    QTest::addColumn<QString>("runnerSetting"); // "{root}" stands for the test's folder; null: not set
    QTest::addColumn<QString>("runnerFile"); // where the recorder stands in for the runner
    QTest::addColumn<QStringList>("runnerArguments"); // before the game's path

    QTest::newRow("setting with arguments")
        << QStringLiteral("\"{root}/runners/my runner\" --quiet -x") << QStringLiteral("runners/my runner")
        << QStringList {QStringLiteral("--quiet"), QStringLiteral("-x")};
    QTest::newRow("setting, name on PATH")
        << QStringLiteral("proton-run") << QStringLiteral("bin/proton-run") << QStringList();
    QTest::newRow("default wine on PATH") << QString() << QStringLiteral("bin/wine") << QStringList();
    QTest::newRow("blank setting is the default")
        << QStringLiteral("   ") << QStringLiteral("bin/wine") << QStringList();
}

void tst_GameLauncher::windowsGameThroughRunner()
{
    QFETCH(QString, runnerSetting);
    QFETCH(QString, runnerFile);
    QFETCH(QStringList, runnerArguments);
    QVERIFY(!installGame(runnerFile).isEmpty());
    if (!runnerSetting.isNull()) {
        runnerSetting.replace(QStringLiteral("{root}"), m_env->root());
        QVERIFY(SaveSetting(
            AppTitle(), CatalogueKeys::SettingsSection, QStringLiteral("CompatibilityRunner"), runnerSetting));
    }
    const QString game = writeFile(QStringLiteral("Program Files/Card Games/sol.exe"), QByteArray("MZ\x90\x00", 4));

    GameLauncher launcher;
    launcher.launchItem(game, QString());

    const QString runnerName = QFileInfo(runnerFile).fileName();
    QTRY_COMPARE(ReadLaunchRecords(records(), runnerName).size(), 1);
    const LaunchRecord record = ReadLaunchRecords(records(), runnerName).first();
    QCOMPARE(record.program, root(runnerFile));
    QCOMPARE(record.arguments, runnerArguments << game);
    QCOMPARE(record.workingFolder, root(QStringLiteral("Program Files/Card Games")));
}

void tst_GameLauncher::withoutRunnerWindowsGameFailsSilently()
{
    const QString game = writeFile(QStringLiteral("games/Win/game.exe"), QByteArray("MZ\x90\x00", 4));
    // A runner named in the settings that is not there fails the same way as no runner at all.
    for (const QString& runner : {QString(), QStringLiteral("no-such-runner-brimvault")}) {
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, QStringLiteral("CompatibilityRunner"), runner));
        GameLauncher launcher;
        QSignalSpy movies(&launcher, &GameLauncher::flashMovieRequested);
        launcher.launchItem(game, QString());
        QCOMPARE(movies.count(), 0);
        QVERIFY(m_openedUrls.isEmpty());
    }
    // Only the service ran: once per launcher, nothing for the game.
    QTRY_COMPARE(ReadLaunchRecords(records(), QStringLiteral("BrimvaultService")).size(), 2);
    const QStringList recorded = QDir(records()).entryList(QDir::Files);
    QCOMPARE(recorded, QStringList {QStringLiteral("BrimvaultService.record")});
}

QTEST_MAIN(tst_GameLauncher)
#include "tst_gamelauncher.moc"
