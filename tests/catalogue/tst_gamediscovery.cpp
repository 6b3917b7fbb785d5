#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestGameDiscovery : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;

    QString path(const QString& relative) const { return m_env->path(relative); }
    QString games(const QString& relative) const { return path(u"commonappdata/Brimvault/"_s + relative); }
    bool write(const QStringList& relatives) const
    {
        return std::all_of(relatives.begin(), relatives.end(), [this](const QString& r) { return WriteFile(path(r)); });
    }
    struct Run {
        QStringList paths; // without the online entry
        QList<GameEntry> entries;
        DiscoveryResult result;
        int clears = 0;
    };
    Run discover(CatalogueLocations locations = CatalogueLocations::fromSystem(), int stopAt = -1)
    {
        Run run;
        ListBuilder builder(locations.iconsFolder);
        DiscoveryHooks hooks;
        hooks.clearList = [&run] { ++run.clears, run.entries.clear(); };
        hooks.addItem = [&run](const GameEntry& entry) { run.entries.append(entry); };
        if (stopAt >= 0)
            hooks.stopRequested = [&run, stopAt] { return run.entries.size() >= stopAt; };
        run.result = GameDiscovery(builder, locations).Run(hooks);
        for (const GameEntry& entry : run.entries.mid(1))
            run.paths.append(entry.path);
        return run;
    }

private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_env->programDir();
        qputenv("WINEPREFIX", path(u"wine"_s).toLocal8Bit());
    }
    void cleanup() { m_env.reset(); }

    // The games folder's own files first, each folder before the ones below it, the program folder last;
    // Flash movies only from the games folder, never from its advertising folder.
    void installedGames()
    {
        const QString g = u"commonappdata/Brimvault/"_s;
        QVERIFY(write({g + u"root.exe"_s, g + u"b/b.exe"_s, g + u"b/sub/deep.exe"_s, g + u"stop/stopped.exe"_s,
            g + u"flash/movie.swf"_s, g + u"Reclama/advert.exe"_s, u"program/prog.exe"_s,
            u"program/tools/tool.exe"_s}));
        QVERIFY(write({g + u"b/setup.exe"_s, g + u"b/MyINSTALLER.exe"_s, g + u"b/BrimvaultService.exe"_s,
            g + u"b/t.exe"_s, g + u"b/unins000.exe"_s, g + u"b/readme.txt"_s, g + u"b/.hidden.exe"_s,
            g + u"stop/below/hidden.exe"_s, g + u"Reclama/advert.swf"_s, g + u"Reclama/deeper/advert2.swf"_s,
            u"program/Brimvault.exe"_s, u"program/program.swf"_s}));
        QVERIFY(WriteFile(games(u"stop/DIRINFO.BVXINF"_s), "<>StopDir< Yes "));
        const Run run = discover();
        const QStringList paths = run.paths;
        QCOMPARE(QSet<QString>(paths.begin(), paths.end()),
            QSet<QString>({games(u"root.exe"_s), games(u"b/b.exe"_s), games(u"b/sub/deep.exe"_s),
                games(u"stop/stopped.exe"_s), games(u"flash/movie.swf"_s), games(u"Reclama/advert.exe"_s),
                path(u"program/prog.exe"_s), path(u"program/tools/tool.exe"_s)}));
        QCOMPARE(paths.size(), 8);
        QCOMPARE(paths.first(), games(u"root.exe"_s));
        QVERIFY(paths.indexOf(games(u"b/b.exe"_s)) < paths.indexOf(games(u"b/sub/deep.exe"_s)));
        QCOMPARE(paths.mid(6), QStringList({path(u"program/prog.exe"_s), path(u"program/tools/tool.exe"_s)}));
        QCOMPARE(run.result.queuedIcons, 7);
        QCOMPARE(run.entries.at(paths.indexOf(games(u"flash/movie.swf"_s)) + 1).source, IconSource::Flash);
    }

    // A link is walked into once at most: it may show the linked folder's own files, never more.
    void linkBackUpTheTreeEnds()
    {
        QVERIFY(WriteFile(games(u"a/game.exe"_s)));
        QVERIFY(QFile::link(games(u"a"_s), games(u"a/loop"_s)));
        QVERIFY(QFile::link(path(u"commonappdata"_s), games(u"a/up"_s)));
        const Run run = discover();
        QVERIFY(run.paths.contains(games(u"a/game.exe"_s)) && run.paths.size() <= 3);
    }

    // Added games in key order, trimmed; one matching an installed game loosely is not listed twice, a
    // missing file is listed all the same. Then the classic games after the installed ones.
    void addedAndClassicGames()
    {
        const QString installed = games(u"inst/game.exe"_s);
        const QString added = path(u"mine/Added.exe"_s);
        QVERIFY(write({u"windows/sol.exe"_s, u"windows/system32/sol.exe"_s, u"windows/system32/winmine.exe"_s,
            u"windows/spider.exe"_s, u"windows/system32/notepad.exe"_s, u"mine/Added.exe"_s}));
        QVERIFY(WriteFile(installed));
        QVERIFY(WriteFile(m_env->settingsFile(),
            QString(u"[Files]\nCount=9\nFile1=  "_s + installed.toLower() + u" \nFile2= "_s + added + u"  \nFile3="_s
                + installed.chopped(4) + u"\nFile5="_s + added + u"\nFile6="_s + path(u"missing.exe"_s))
                .toUtf8()));
        const Run run = discover();
        QCOMPARE(run.paths,
            QStringList({installed, path(u"windows/spider.exe"_s), path(u"windows/sol.exe"_s),
                path(u"windows/system32/winmine.exe"_s), added, added, path(u"missing.exe"_s)}));
        QCOMPARE(run.entries.at(7).caption, u"missing"_s);
    }

    void microsoftGamesFolder_data()
    {
        QTest::addColumn<int>("version");
        QTest::addColumn<QString>("programFiles");
        QTest::addColumn<QString>("gamesFolder");
        QTest::addColumn<bool>("found");
        QTest::newRow("vista, first candidate")
            << 6 << u"Program Files"_s << u"Program Files/Microsoft Games"_s << true;
        QTest::newRow("32-bit folder, second candidate")
            << 6 << u"Program Files"_s << u"Program Files (x86)/Microsoft Games"_s << true;
        QTest::newRow("64-bit games seen from a 32-bit process")
            << 10 << u"Program Files (x86)"_s << u"Program Files/Microsoft Games"_s << true;
        QTest::newRow("xp has the gaming zone")
            << 5 << u"Program Files"_s << u"Program Files/MSN Gaming Zone"_s << true;
        QTest::newRow("xp ignores microsoft games")
            << 5 << u"Program Files"_s << u"Program Files/Microsoft Games"_s << false;
    }
    void microsoftGamesFolder()
    {
        QFETCH(int, version);
        QFETCH(QString, programFiles);
        QFETCH(QString, gamesFolder);
        QFETCH(bool, found);
        QVERIFY(write({gamesFolder + u"/Chess/Chess.exe"_s, gamesFolder + u"/Chess/ZClientM.exe"_s,
            gamesFolder + u"/hrtzzm.exe"_s}));
        CatalogueLocations locations = CatalogueLocations::fromSystem();
        locations.windowsMajorVersion = version;
        locations.programFiles = path(programFiles);
        const Run run = discover(locations);
        const QString folder = path(gamesFolder);
        QCOMPARE(run.paths,
            found ? QStringList({folder + u"/hrtzzm.exe"_s, folder + u"/Chess/Chess.exe"_s}) : QStringList());
        QVERIFY(!found || run.entries.at(1).caption == u"Internet Chervi"_s);
    }

    void pinballFromTheFirstDrive()
    {
        const QString pinball = u"/Program Files/Windows NT/Pinball/PINBALL.exe"_s;
        QVERIFY(write(
            {u"wine/dosdevices/e:"_s + pinball, u"wine/dosdevices/d:"_s + pinball, u"wine/dosdevices/b:"_s + pinball}));
        QCOMPARE(discover().paths, QStringList({path(u"wine/dosdevices/d:"_s) + pinball}));
    }

    void stopFlag_data()
    {
        QTest::addColumn<int>("stopAt");
        QTest::addColumn<int>("items");
        QTest::newRow("before anything") << 0 << 0;
        QTest::newRow("after the online entry") << 1 << 1;
        QTest::newRow("after an installed game") << 2 << 2;
        QTest::newRow("after a windows game") << 3 << 3;
        QTest::newRow("never") << 100 << 4;
    }
    void stopFlag()
    {
        QFETCH(int, stopAt);
        QVERIFY(write({u"commonappdata/Brimvault/inst/game.exe"_s, u"windows/sol.exe"_s}));
        QVERIFY(SaveSetting(AppTitle(), u"Files"_s, u"File1"_s, path(u"added.exe"_s)));
        const Run run = discover(CatalogueLocations::fromSystem(), stopAt);
        QTEST(int(run.entries.size()), "items");
        QTEST(run.result.items, "items");
        QCOMPARE(run.clears, stopAt > 0 ? 1 : 0);
        QCOMPARE(run.result.stopped, stopAt <= 3);
    }
};
BV_REGISTER_TEST(TestGameDiscovery);
#include "tst_gamediscovery.moc"
