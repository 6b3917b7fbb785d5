#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/GameEntry.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include "CatalogueTestTree.h"
#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;
using namespace CatalogueTestTree;

class TestGameDiscovery : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void cleanup();
    void onlyTheOnlineEntry();
    void installedGames();
    void flashMoviesOnlyInTheGamesFolder();
    void linkBackUpTheTreeEnds();
    void addedGames();
    void classicGames();
    void microsoftGamesFolder_data();
    void microsoftGamesFolder();
    void pinballFromTheFirstDrive();
    void stopFlag_data();
    void stopFlag();

private:
    struct Run {
        QList<GameEntry> entries;
        DiscoveryResult result;
        int clears = 0;
    };
    Run discover(const CatalogueLocations& locations, const std::function<bool(int)>& stopAfter = {});
    QString games(const QString& relative) const;

    std::unique_ptr<TestEnvironment> m_env;
};

void TestGameDiscovery::initTestCase()
{
    modLocalizer::UseBuiltInLanguage();
}

void TestGameDiscovery::init()
{
    m_env = std::make_unique<TestEnvironment>();
    QDir(m_env->root()).mkpath(QStringLiteral("program"));
    qputenv("BRIMVAULT_PROGRAM_DIR", m_env->path(QStringLiteral("program")).toLocal8Bit());
    qputenv("WINEPREFIX", m_env->path(QStringLiteral("wine")).toLocal8Bit());
}

void TestGameDiscovery::cleanup()
{
    m_env.reset();
}

QString TestGameDiscovery::games(const QString& relative) const
{
    return m_env->path(QStringLiteral("commonappdata/Brimvault/") + relative);
}

TestGameDiscovery::Run TestGameDiscovery::discover(
    const CatalogueLocations& locations, const std::function<bool(int)>& stopAfter)
{
    Run run;
    ListBuilder builder(locations.iconsFolder);
    GameDiscovery discovery(builder, locations);
    DiscoveryHooks hooks;
    hooks.clearList = [&run] {
        ++run.clears;
        run.entries.clear();
    };
    hooks.addItem = [&run](const GameEntry& entry) { run.entries.append(entry); };
    if (stopAfter)
        hooks.stopRequested = [&run, &stopAfter] { return stopAfter(int(run.entries.size())); };
    run.result = discovery.Run(hooks);
    return run;
}

void TestGameDiscovery::onlyTheOnlineEntry()
{
    const Run run = discover(CatalogueLocations::fromSystem());
    QCOMPARE(run.clears, 1);
    QCOMPARE(run.entries.size(), 1);
    QCOMPARE(run.entries.first().source, IconSource::Online);
    QCOMPARE(run.entries.first().caption, QStringLiteral("Online games"));
    QCOMPARE(run.result.items, 1);
    QCOMPARE(run.result.queuedIcons, 0);
    QVERIFY(!run.result.stopped);
}

void TestGameDiscovery::installedGames()
{
    QVERIFY(writeFile(games(QStringLiteral("root.exe"))));
    QVERIFY(writeFile(games(QStringLiteral("b/b.exe"))));
    for (const char* skipped : {"b/setup.exe", "b/MyINSTALLER.exe", "b/BrimvaultService.exe", "b/t.exe",
             "b/unins000.exe", "b/readme.txt", "b/.hidden.exe", "stop/below/hidden.exe"})
        QVERIFY(writeFile(games(QString::fromLatin1(skipped))));
    QVERIFY(writeFile(games(QStringLiteral("b/sub/deep.exe"))));
    QVERIFY(writeFile(games(QStringLiteral("stop/stopped.exe"))));
    QVERIFY(writeStopMark(games(QStringLiteral("stop")), QStringLiteral(" Yes ")));
    QVERIFY(writeFile(games(QStringLiteral("lower/x/kept.exe"))));
    QVERIFY(writeStopMark(games(QStringLiteral("lower")), QStringLiteral("yes")));
    QVERIFY(writeFile(m_env->path(QStringLiteral("program/prog.exe"))));
    QVERIFY(writeFile(m_env->path(QStringLiteral("program/Brimvault.exe"))));
    QVERIFY(writeFile(m_env->path(QStringLiteral("program/tools/tool.exe"))));

    const Run run = discover(CatalogueLocations::fromSystem());
    const QStringList paths = pathsOf(run.entries);
    const QStringList expected {games(QStringLiteral("root.exe")), games(QStringLiteral("b/b.exe")),
        games(QStringLiteral("b/sub/deep.exe")), games(QStringLiteral("stop/stopped.exe")),
        games(QStringLiteral("lower/x/kept.exe")), m_env->path(QStringLiteral("program/prog.exe")),
        m_env->path(QStringLiteral("program/tools/tool.exe"))};
    QCOMPARE(QSet<QString>(paths.begin() + 1, paths.end()), QSet<QString>(expected.begin(), expected.end()));
    QCOMPARE(paths.size(), expected.size() + 1);
    // The games folder's own files first, each folder before the ones below it, the program folder last.
    const auto at = [&paths](const QString& path) { return paths.indexOf(path); };
    QCOMPARE(at(expected.at(0)), 1);
    QVERIFY(at(expected.at(1)) < at(expected.at(2)));
    QVERIFY(at(expected.at(4)) < at(expected.at(5)));
    QCOMPARE(at(expected.at(5)), 6);
    QCOMPARE(at(expected.at(6)), 7);
    QCOMPARE(run.result.queuedIcons, 7);
}

void TestGameDiscovery::flashMoviesOnlyInTheGamesFolder()
{
    QVERIFY(writeFile(games(QStringLiteral("flash/movie.swf"))));
    QVERIFY(writeFile(games(QStringLiteral("flash/setup.swf"))));
    QVERIFY(writeFile(games(QStringLiteral("Reclama/advert.swf"))));
    QVERIFY(writeFile(games(QStringLiteral("Reclama/advert.exe"))));
    QVERIFY(writeFile(games(QStringLiteral("Reclama/deeper/advert2.swf"))));
    QVERIFY(writeFile(m_env->path(QStringLiteral("program/program.swf"))));

    const Run run = discover(CatalogueLocations::fromSystem());
    const QStringList paths = pathsOf(run.entries).mid(1);
    QCOMPARE(QSet<QString>(paths.begin(), paths.end()),
        QSet<QString>({games(QStringLiteral("flash/movie.swf")), games(QStringLiteral("flash/setup.swf")),
            games(QStringLiteral("Reclama/advert.exe"))}));
    for (const GameEntry& entry : run.entries.mid(1))
        QCOMPARE(entry.source, entry.path.endsWith(u".swf"_qs) ? IconSource::Flash : IconSource::Queued);
    QCOMPARE(run.result.queuedIcons, 1);
}

void TestGameDiscovery::linkBackUpTheTreeEnds()
{
    QVERIFY(writeFile(games(QStringLiteral("a/game.exe"))));
    QVERIFY(QFile::link(games(QStringLiteral("a")), games(QStringLiteral("a/loop"))));
    QVERIFY(QFile::link(m_env->path(QStringLiteral("commonappdata")), games(QStringLiteral("a/up"))));
    const Run run = discover(CatalogueLocations::fromSystem());
    const QStringList paths = pathsOf(run.entries);
    QVERIFY(paths.contains(games(QStringLiteral("a/game.exe"))));
    // A link is walked into once at most: it may show the linked folder's own files, never more.
    QVERIFY2(paths.size() <= 4, qPrintable(paths.join(u'\n')));
}

void TestGameDiscovery::addedGames()
{
    const QString installed = games(QStringLiteral("inst/game.exe"));
    QVERIFY(writeFile(installed));
    const QString added = m_env->path(QStringLiteral("mine/Added.exe"));
    QVERIFY(writeFile(added));
    const auto save = [](const QString& key, const QString& value) {
        return SaveSetting(AppTitle(), QStringLiteral("Files"), key, value);
    };
    QVERIFY(save(QStringLiteral("Count"), QStringLiteral("9")));
    QVERIFY(save(QStringLiteral("COUNT"), QStringLiteral("9")));
    QVERIFY(save(QStringLiteral("File1"), u"  "_qs + installed.toLower() + u" "_qs));
    QVERIFY(save(QStringLiteral("File2"), u" "_qs + added + u"  "_qs));
    QVERIFY(save(QStringLiteral("File3"), installed.left(installed.size() - 4)));
    QVERIFY(save(QStringLiteral("File5"), added));
    QVERIFY(save(QStringLiteral("File6"), m_env->path(QStringLiteral("missing.exe"))));

    const Run run = discover(CatalogueLocations::fromSystem());
    QCOMPARE(pathsOf(run.entries).mid(1),
        QStringList({installed, added, added, m_env->path(QStringLiteral("missing.exe"))}));
    QCOMPARE(captionsOf(run.entries).mid(1), QStringList({u"game"_qs, u"Added"_qs, u"Added"_qs, u"missing"_qs}));
}

void TestGameDiscovery::classicGames()
{
    const QString windows = m_env->path(QStringLiteral("windows"));
    QVERIFY(writeFile(windows + u"/sol.exe"_qs));
    QVERIFY(writeFile(windows + u"/system32/sol.exe"_qs));
    QVERIFY(writeFile(windows + u"/system32/winmine.exe"_qs));
    QVERIFY(writeFile(windows + u"/spider.exe"_qs));
    QVERIFY(writeFile(windows + u"/system32/notepad.exe"_qs));
    QVERIFY(writeFile(games(QStringLiteral("inst/game.exe"))));

    const Run run = discover(CatalogueLocations::fromSystem());
    QCOMPARE(pathsOf(run.entries).mid(1),
        QStringList({games(QStringLiteral("inst/game.exe")), windows + u"/spider.exe"_qs, windows + u"/sol.exe"_qs,
            windows + u"/system32/winmine.exe"_qs}));
}

void TestGameDiscovery::microsoftGamesFolder_data()
{
    QTest::addColumn<int>("version");
    QTest::addColumn<QString>("programFiles");
    QTest::addColumn<QString>("gamesFolder");
    QTest::addColumn<bool>("found");
    QTest::newRow("vista, first candidate") << 6 << u"Program Files"_qs << u"Program Files/Microsoft Games"_qs << true;
    QTest::newRow("32-bit folder, second candidate")
        << 6 << u"Program Files"_qs << u"Program Files (x86)/Microsoft Games"_qs << true;
    QTest::newRow("64-bit games seen from a 32-bit process")
        << 10 << u"Program Files (x86)"_qs << u"Program Files/Microsoft Games"_qs << true;
    QTest::newRow("xp has the gaming zone") << 5 << u"Program Files"_qs << u"Program Files/MSN Gaming Zone"_qs << true;
    QTest::newRow("xp ignores microsoft games")
        << 5 << u"Program Files"_qs << u"Program Files/Microsoft Games"_qs << false;
    QTest::newRow("vista ignores the gaming zone")
        << 6 << u"Program Files"_qs << u"Program Files/MSN Gaming Zone"_qs << false;
}

void TestGameDiscovery::microsoftGamesFolder()
{
    QFETCH(int, version);
    QFETCH(QString, programFiles);
    QFETCH(QString, gamesFolder);
    QFETCH(bool, found);

    const QString folder = m_env->path(gamesFolder);
    QVERIFY(writeFile(folder + u"/Chess/Chess.exe"_qs));
    QVERIFY(writeFile(folder + u"/Chess/ZClientM.exe"_qs));
    QVERIFY(writeFile(folder + u"/hrtzzm.exe"_qs));
    CatalogueLocations locations = CatalogueLocations::fromSystem();
    locations.windowsMajorVersion = version;
    locations.programFiles = m_env->path(programFiles);

    const Run run = discover(locations);
    if (!found) {
        QCOMPARE(run.entries.size(), 1);
        return;
    }
    QCOMPARE(pathsOf(run.entries).mid(1), QStringList({folder + u"/hrtzzm.exe"_qs, folder + u"/Chess/Chess.exe"_qs}));
    QCOMPARE(run.entries.at(1).caption, QStringLiteral("Internet Chervi"));
}

void TestGameDiscovery::pinballFromTheFirstDrive()
{
    const QString relative = QStringLiteral("/Program Files/Windows NT/Pinball/PINBALL.exe");
    QVERIFY(writeFile(m_env->path(QStringLiteral("wine/dosdevices/e:")) + relative));
    QVERIFY(writeFile(m_env->path(QStringLiteral("wine/dosdevices/d:")) + relative));
    QVERIFY(writeFile(m_env->path(QStringLiteral("wine/dosdevices/b:")) + relative));
    const Run run = discover(CatalogueLocations::fromSystem());
    QCOMPARE(pathsOf(run.entries).mid(1), QStringList({m_env->path(QStringLiteral("wine/dosdevices/d:")) + relative}));
}

void TestGameDiscovery::stopFlag_data()
{
    QTest::addColumn<int>("stopAt");
    QTest::addColumn<int>("expectedItems");
    QTest::addColumn<int>("expectedClears");
    QTest::newRow("before anything") << 0 << 0 << 0;
    QTest::newRow("after the online entry") << 1 << 1 << 1;
    QTest::newRow("after an installed game") << 2 << 2 << 1;
    QTest::newRow("after a windows game") << 3 << 3 << 1;
    QTest::newRow("never") << 100 << 4 << 1;
}

void TestGameDiscovery::stopFlag()
{
    QFETCH(int, stopAt);
    QFETCH(int, expectedItems);
    QFETCH(int, expectedClears);
    QVERIFY(writeFile(games(QStringLiteral("inst/game.exe"))));
    QVERIFY(writeFile(m_env->path(QStringLiteral("windows/sol.exe"))));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"File1"_qs, m_env->path(QStringLiteral("added.exe"))));

    const Run run = discover(CatalogueLocations::fromSystem(), [stopAt](int items) { return items >= stopAt; });
    QCOMPARE(run.entries.size(), expectedItems);
    QCOMPARE(run.result.items, expectedItems);
    QCOMPARE(run.clears, expectedClears);
    QCOMPARE(run.result.stopped, stopAt <= 3);
}

QTEST_MAIN(TestGameDiscovery)
#include "tst_gamediscovery.moc"
