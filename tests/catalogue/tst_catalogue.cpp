// Finding the games of the computer and the rules for them: names, icon cache keys, which files are games,
// finding, orders, play history; adding games by hand, by folder and by drop; the entries of the list, the icons
// built for them in the background, and the listing on the command line.
#include "catalogue/CatalogueListing.h"
#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameAdder.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/GameFileRules.h"
#include "catalogue/GameFinder.h"
#include "catalogue/GameNames.h"
#include "catalogue/IconCacheBuilder.h"
#include "catalogue/IconCacheKey.h"
#include "catalogue/ListBuilder.h"
#include "catalogue/ListOrder.h"
#include "catalogue/ListedPaths.h"
#include "catalogue/PlayHistoryText.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"

#include "CatalogueFiles.h"
#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QTimeZone>
#include <QtEndian>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Pairs = QList<QPair<QString, QString>>;
using Outcome = IconCacheBuilder::Outcome;

namespace {

GameEntry ListOne(const QString& path, bool keepPictures = true)
{
    ListBuilder builder(DataFolders::IconsFolder());
    builder.setKeepPictures(keepPictures);
    builder.beginPass();
    return builder.AddGameToList(path);
}

QString cacheOf(const QString& path)
{
    return IconCacheFile(DataFolders::IconsFolder(), path);
}

// The exit code and what the program printed; -1 when it did not end by itself.
QPair<int, QByteArray> run(const QStringList& arguments)
{
    QProcess process;
    process.start(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"), arguments);
    if (!process.waitForFinished(60000) || process.exitStatus() != QProcess::NormalExit)
        return {-1, {}};
    return {process.exitCode(), process.readAllStandardOutput()};
}

// Games named by their captions, each under C:\Games; the captions of a list joined by ",".
QList<GameEntry> named(const QStringList& captions)
{
    QList<GameEntry> list;
    for (const QString& caption : captions) {
        GameEntry entry;
        entry.caption = caption;
        entry.path = u"C:\\Games\\"_s + caption + u".exe"_s;
        list.append(entry);
    }
    return list;
}
QString captions(const QList<GameEntry>& list)
{
    QStringList result;
    for (const GameEntry& entry : list)
        result.append(entry.caption);
    return result.join(u',');
}

} // namespace

#define REQUIRE_PE(fixture, path) REQUIRE_FIXTURE(CopyFixture(PeFixture(fixture), path), "the PE fixtures (mingw-w64)")

class TestCatalogue : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ListBuilder> m_builder;
    std::unique_ptr<GameAdder> m_adder;

    QString path(const QString& relative) const { return m_env->path(relative); }
    QString games(const QString& relative) const { return path(u"commonappdata/Brimvault/"_s + relative); }
    QString tree(const QString& name = QString()) const { return path(u"tree/"_s + name); }
    QString game(const QString& name = u"game.exe"_s) const { return path(u"games/"_s + name); }
    bool write(const QString& folder, const QStringList& names) const
    {
        return std::all_of(
            names.begin(), names.end(), [&](const QString& name) { return WriteFile(path(folder + name)); });
    }
    static QStringList pathsOf(const QList<GameEntry>& entries)
    {
        QStringList paths;
        for (const GameEntry& entry : entries)
            paths.append(entry.path);
        return paths;
    }
    static Pairs filesSection() { return GetAllSettings(AppTitle(), u"Files"_s); }
    void start(const QByteArray& settings)
    {
        QVERIFY(WriteFile(m_env->settingsFile(), settings));
        m_builder->beginPass();
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
        run.paths = pathsOf(run.entries.mid(1));
        return run;
    }

private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_env->programDir();
        qputenv("WINEPREFIX", path(u"wine"_s).toLocal8Bit());
        m_builder = std::make_unique<ListBuilder>(m_env->path(u"commonappdata/Brimvault/Icons/"_s));
        m_adder = std::make_unique<GameAdder>(*m_builder);
    }
    void cleanup()
    {
        m_adder.reset();
        m_builder.reset();
        m_env.reset();
    }

    // The games folder's own files first, each folder before the ones below it, the program folder last;
    // Flash movies only from the games folder, never from its advertising folder.
    void installedGames()
    {
        QVERIFY(write(u"commonappdata/Brimvault/"_s,
            {u"root.exe"_s, u"b/b.exe"_s, u"b/sub/deep.exe"_s, u"stop/stopped.exe"_s, u"flash/movie.swf"_s,
                u"Reclama/advert.exe"_s, u"b/setup.exe"_s, u"b/.hidden.exe"_s, u"stop/below/hidden.exe"_s,
                u"Reclama/advert.swf"_s, u"Reclama/deeper/advert2.swf"_s}));
        QVERIFY(write(u"program/"_s, {u"prog.exe"_s, u"tools/tool.exe"_s, u"Brimvault.exe"_s, u"program.swf"_s}));
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

    // A link is walked into once at most: it may show the linked folder's own files, never more; the folders
    // after it in walk order are still walked (a loop in each folder puts one before the other's games).
    void linkBackUpTheTreeEnds()
    {
        for (const QString& folder : {u"a"_s, u"c"_s}) {
            QVERIFY(WriteFile(games(folder + u"/g/game.exe"_s)));
            QVERIFY(QFile::link(games(folder), games(folder + u"/loop"_s)));
        }
        QVERIFY(QFile::link(path(u"commonappdata"_s), games(u"a/up"_s)));
        QStringList paths = discover().paths;
        paths.sort();
        QCOMPARE(paths, QStringList({games(u"a/g/game.exe"_s), games(u"c/g/game.exe"_s)}));
    }

    // Added games in key order, trimmed; one matching an installed game loosely is not listed twice, a
    // missing file is listed all the same. Then the classic games after the installed ones, the pinball from the
    // first drive from C: holding it.
    void addedAndClassicGames()
    {
        const QString installed = games(u"inst/game.exe"_s);
        const QString added = path(u"mine/Added.exe"_s);
        QVERIFY(write(u"windows/"_s,
            {u"sol.exe"_s, u"system32/sol.exe"_s, u"system32/winmine.exe"_s, u"spider.exe"_s,
                u"system32/notepad.exe"_s}));
        const QString pinball = u"/Program Files/Windows NT/Pinball/PINBALL.exe"_s;
        QVERIFY(write(u"wine/dosdevices/"_s, {u"e:"_s + pinball, u"d:"_s + pinball, u"b:"_s + pinball}));
        QVERIFY(WriteFile(installed) && WriteFile(added));
        QVERIFY(WriteFile(m_env->settingsFile(),
            QString(u"[Files]\nCount=9\nFile1=  "_s + installed.toLower() + u" \nFile2= "_s + added + u"  \nFile3="_s
                + installed.chopped(4) + u"\nFile5="_s + added + u"\nFile6="_s + path(u"missing.exe"_s))
                .toUtf8()));
        const Run run = discover();
        QCOMPARE(run.paths,
            QStringList({installed, path(u"windows/spider.exe"_s), path(u"windows/sol.exe"_s),
                path(u"windows/system32/winmine.exe"_s), path(u"wine/dosdevices/d:"_s) + pinball, added, added,
                path(u"missing.exe"_s)}));
        QCOMPARE(run.entries.at(8).caption, u"missing"_s);
        QVERIFY(!run.result.stopped && run.result.items == run.entries.size() && run.clears == 1);
        // Asked to stop before anything, after the installed game or after the first classic one, it stops there.
        for (const int stopAt : {0, 2, 3}) {
            const Run stopped = discover(CatalogueLocations::fromSystem(), stopAt);
            QCOMPARE(
                QList<int>({stopped.result.stopped, stopped.result.items, int(stopped.entries.size()), stopped.clears}),
                QList<int>({1, stopAt, stopAt, stopAt > 0}));
        }
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
        QVERIFY(write(gamesFolder, {u"/Chess/Chess.exe"_s, u"/Chess/ZClientM.exe"_s, u"/hrtzzm.exe"_s}));
        CatalogueLocations locations = CatalogueLocations::fromSystem();
        locations.windowsMajorVersion = version;
        locations.programFiles = path(programFiles);
        const Run run = discover(locations);
        const QString folder = path(gamesFolder);
        QCOMPARE(run.paths,
            found ? QStringList({folder + u"/hrtzzm.exe"_s, folder + u"/Chess/Chess.exe"_s}) : QStringList());
        QVERIFY(!found || run.entries.at(1).caption == u"Internet Chervi"_s);
    }

    // Chosen by hand, the same file in other letter case and blanks is not added twice; an installer (by
    // its version text) is skipped in a folder, yet a game when chosen by hand.
    void addFileOnce()
    {
        m_builder->beginPass();
        REQUIRE_FIXTURE(CopyFixture(CatalogueFixture(u"setup_desc.exe"_s), tree(u"puzzles.exe"_s))
                && CopyFixture(PeFixture(u"multi64.exe"_s), tree(u"marble.exe"_s)),
            "the executable fixtures (mingw-w64)");
        const QList<GameEntry> added = m_adder->AddGamesFromFolder(tree());
        QCOMPARE(pathsOf(added), QStringList({tree(u"marble.exe"_s)}));
        const auto chosen = m_adder->AddGameFile(tree(u"puzzles.exe"_s));
        QVERIFY(chosen && chosen->caption == u"Puzzle Pack Setup Wizard"_s);
        QVERIFY(!m_adder->AddGameFile(u"  "_s + tree(u"PUZZLES.EXE"_s).toUpper() + u" "_s));
        QCOMPARE(filesSection(),
            Pairs({{u"File1"_s, tree(u"marble.exe"_s)}, {u"Count"_s, u"2"_s}, {u"File2"_s, tree(u"puzzles.exe"_s)}}));
    }

    // Below the root first, each folder before its sub-folders; the stop-marked folder's own files are still
    // taken, nothing below it; the root comes last. One folder per level keeps the listing order out of it.
    // Numbers go on from the highest in use when the counter is below it.
    void addFolderWalkOrder()
    {
        start("[Files]\nCount=2\nFile5=/old.exe\n");
        QVERIFY(write(u"tree/"_s, {u"top.exe"_s, u"a/a.exe"_s, u"a/b/b.swf"_s, u"a/b/c/c.exe"_s, u"a/b/c/d/d.exe"_s}));
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
        QVERIFY(write(u"tree/"_s,
            {u"game.exe"_s, u"movie.SWF"_s, u"setup.exe"_s, u"Install.exe"_s, u"uninst.exe"_s, u"t.exe"_s,
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

    void entries_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        // A game file (plain, or a copy of a built fixture) with a user's name and an info file. The user's name
        // belongs to the entry whose path matches after trimming and in any case; of a name key written twice by
        // hand the first counts.
        const auto caption = [](const QString& fileName, const QString& fixture, const QByteArray& userName = {},
                                 const QByteArray& info = {}) -> QString {
            TestEnvironment env;
            const QString path = env.path(u"games/"_s + fileName);
            if (fixture.isEmpty() ? !WriteFile(path) : !CopyFixture(fixture, path))
                return u"missing the executable fixtures (mingw-w64): build them with make test"_s;
            if (!info.isEmpty())
                WriteFile(path.chopped(4) + u".BVXINF"_s, info);
            WriteFile(env.settingsFile(),
                "[Files]\nFILE7=  " + path.toUpper().toUtf8() + "\nFile8=" + env.path(u"x"_s).toUtf8()
                    + "\n[FilesNames]\n"
                    + (userName.isEmpty() ? QByteArray() : "filename7=" + userName + "\nFileName7=Wrong\n")
                    + "FileName8=Wrong\n");
            return ListOne(path).caption;
        };
        // The window decodes a sound bitmap image when it first shows it.
        const auto shownWidth = [](const GameEntry& entry) {
            return entry.picture.isNull() ? ListBuilder::ShownPicture(entry.iconFile).width() : entry.picture.width();
        };
        // Every image's header zeroed: the directory is sound, no image can be drawn.
        const auto damagedImages = [](QByteArray icon) {
            for (int i = 0; i < qFromLittleEndian<quint16>(icon.constData() + 4); ++i)
                icon.replace(qFromLittleEndian<quint32>(icon.constData() + 18 + 16 * i), 4, QByteArray(4, '\0'));
            return icon;
        };
        // Where the icon comes from, the file shown and its width; v: a valid icon file, c: a cut one,
        // d: one with damaged images.
        const auto icon = [shownWidth, damagedImages](const QString& fileName, char own, char cache) -> QString {
            TestEnvironment env;
            const QByteArray valid = ValidIconFile();
            if (valid.isEmpty())
                return u"missing the PE fixture multi64.exe (mingw-w64): build it with make test"_s;
            const QString path = env.path(u"games/"_s + fileName);
            const QString ownFile = path.left(path.lastIndexOf(u'.')) + u".ICO"_s;
            const QString cacheFile = cacheOf(path);
            WriteFile(path);
            const auto bytes = [&](char kind) {
                return kind == 'v' ? valid : kind == 'd' ? damagedImages(valid) : valid.left(40);
            };
            if (own != '-')
                WriteFile(ownFile, bytes(own));
            if (cache != '-')
                WriteFile(cacheFile, bytes(cache));
            const GameEntry entry = ListOne(path);
            // The command line asks for the decision without the picture.
            const GameEntry bare = ListOne(path, false);
            return IconSourceName(entry.source) + u' ' + QString::number(shownWidth(entry))
                + (entry.iconFile == ownFile          ? u" own"_s
                        : entry.iconFile == cacheFile ? u" cache"_s
                                                      : entry.iconFile)
                + (bare.source == entry.source && bare.picture.isNull() ? QString() : u" differs bare"_s);
        };
        // Each takes the first source that has a name: user, info file, zone table, version text, file title.
        QTest::newRow("user name first") << caption(u"hrtzzm.exe"_s, {}, "My Hearts", "<>Name<Info Hearts")
                                         << u"My Hearts"_s;
        QTest::newRow("info file before zone table")
            << caption(u"hrtzzm.exe"_s, {}, {}, "<>Name<Info Hearts") << u"Info Hearts"_s;
        QTest::newRow("zone member without row falls to version")
            << caption(u"zm.exe"_s, PeFixture(u"multi64.exe"_s)) << u"Marble Cascade"_s;
        QTest::newRow("long version text trimmed, cut and broken")
            << caption(u"long.exe"_s, CatalogueFixture(u"long_desc.exe"_s)) << u"SuperMegaUlt raExtremeHyp erDelu..."_s;
        QTest::newRow("version without description")
            << caption(u"nodesc.exe"_s, PeFixture(u"ver_nodesc64.exe"_s)) << u"nodesc"_s;
        QTest::newRow("user name is tidied too")
            << caption(u"g.exe"_s, {}, u"Исполняемый файл для игры Шашки"_s.toUtf8()) << u"Шашки"_s;
        QTest::newRow("own icon wins over cache") << icon(u"a.exe"_s, 'v', 'v') << u"file 32 own"_s;
        QTest::newRow("corrupt own icon queues, cache or not") << icon(u"a.exe"_s, 'c', 'v') << u"queued 0"_s;
        QTest::newRow("cache") << icon(u"a.exe"_s, '-', 'v') << u"cache 32 cache"_s;
        QTest::newRow("cache with damaged images") << icon(u"a.exe"_s, '-', 'd') << u"queued 0"_s;
        QTest::newRow("nothing") << icon(u"a.exe"_s, '-', '-') << u"queued 0"_s;
        QTest::newRow("flash with corrupt cache") << icon(u"movie.SWF"_s, '-', 'c') << u"flash 0"_s;
        QTest::newRow("flash with own icon") << icon(u"movie.swf"_s, 'v', '-') << u"file 32 own"_s;
    }
    void entries()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    // Closing stops the work before the next game; a damaged cache file is replaced, a good one is used as it is
    // even when the game changed. Without the data folder an icon is shown, yet neither cached nor the folder made.
    void onePerTick()
    {
        const QStringList games {game(u"one.exe"_s), game(u"two.exe"_s)};
        IconCacheBuilder builder(DataFolders::IconsFolder());
        for (qsizetype i = 0; i < games.size(); ++i) {
            REQUIRE_PE(u"multi64.exe"_s, games.at(i));
            builder.enqueue(games.at(i), quint64(100 + i));
        }
        const IconCacheBuilder::Result uncached = builder.BuildIcon(games.at(0));
        QVERIFY(uncached.outcome == Outcome::Extracted && !uncached.saved && !uncached.picture.isNull());
        QVERIFY(!QFileInfo::exists(DataFolders::GamesFolder()));
        QVERIFY(WriteFile(cacheOf(games.at(0)), QByteArray("\0\0\1\0\1\0", 6)));
        QVERIFY(!builder.Tick(true) && builder.pending() == 2);
        const auto first = builder.Tick(false);
        QVERIFY(first && first->ticket == 100 && first->path == games.at(0));
        QCOMPARE(first->result.outcome, Outcome::Extracted);
        QVERIFY(builder.pending() == 1 && QFileInfo(cacheOf(games.at(0))).size() > 6);
        QVERIFY(!QFileInfo::exists(cacheOf(games.at(1))));
        const auto second = builder.Tick(false);
        QVERIFY(second && second->ticket == 101 && builder.pending() == 0 && !builder.Tick(false));
        REQUIRE_PE(u"nores64.exe"_s, games.at(0));
        const IconCacheBuilder::Result cached = builder.BuildIcon(games.at(0));
        QVERIFY(cached.outcome == Outcome::FromCache && !cached.saved);
        QCOMPARE(cached.picture, first->result.picture);
        REQUIRE_PE(u"nores64.exe"_s, game(u"none.exe"_s));
        const IconCacheBuilder::Result none = builder.BuildIcon(game(u"none.exe"_s));
        QVERIFY(none.outcome == Outcome::NoIcon && none.picture.isNull() && !none.saved);
    }

    // The program's --list and --json output in the stored language, read as a user's script would.
    void listing()
    {
        const QString movie = DataFolders::GamesFolder() + u"movie.swf"_s;
        const QString zone = m_env->path(u"mine/hrtzzm.exe"_s);
        QVERIFY(WriteFile(movie) && WriteFile(m_env->path(u"windows/sol.exe"_s)));
        QVERIFY(SaveSetting(AppTitle(), u"Files"_s, u"File5"_s, zone));
        // Without a stored language the window's start-up would store one; the listing must not.
        const auto before = SnapshotTree(m_env->root());
        const auto [jsonExit, json] = run({u"--list"_s, u"--json"_s});
        QCOMPARE(jsonExit, 0);
        QCOMPARE(SnapshotTree(m_env->root()), before);
        QStringList items;
        for (const QJsonValue& value : QJsonDocument::fromJson(json).array())
            items.append(value[u"caption"_s].toString() + u'\t' + value[u"icon"_s].toString());
        QCOMPARE(items,
            QStringList(
                {u"Online games\tonline"_s, u"movie\tflash"_s, u"sol\tqueued"_s, u"Internet Chervi\tqueued"_s}));

        QVERIFY(WriteFile(m_env->programDir() + u"/Brimvault_Test.lng"_s,
            "#language=Testish\n#charset=204\n@1250=Online Test\n@2030=Test Chervi\n"));
        QVERIFY(SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, u"Brimvault_Test.lng"_s)
            && SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngNik"_s, u"TST"_s));
        const auto [textExit, text] = run({u"--list"_s});
        QCOMPARE(textExit, 0);
        QCOMPARE(run({u"--list"_s, u"--json"_s, u"--xml"_s}), qMakePair(2, QByteArray()));
        QCOMPARE(QString::fromUtf8(text),
            u"Online Test\thttp://127.0.0.1:9/online-games-catalog.asp\nmovie\t"_s + movie + u"\nsol\t"_s
                + m_env->path(u"windows/sol.exe"_s) + u"\nTest Chervi\t"_s + zone + u'\n');
    }

    void rules_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const auto tidy = &GameNames::TidyName;
        const auto zone = &GameNames::BuiltInName;
        // The icon cache file, its name summed over the path in the code page of the user's locale (summed by
        // hand from the code page tables: windows-1251 И = 0xC8, г = 0xE3, ...); none without a cache folder.
        const auto cacheFile = [](const QString& path, const QByteArray& locale = QByteArray()) -> QString {
            TestEnvironment env;
            if (!locale.isEmpty())
                env.setLocale(locale);
            return IconCacheFile(u"/c/"_s, path) + IconCacheFile(QString(), path);
        };
        // Whether discovery lists the file, and whether a folder scan takes its extension.
        const auto names = [](const QString& name) -> QString {
            return QString::number(GameFileRules::IsDiscoverableExecutable(name))
                + QString::number(GameFileRules::HasAcceptedExtension(name));
        };
        // "Is this a piece of what was listed" answers as a substring search over the tab-joined paths does.
        const auto listed = [](const QString& piece, bool any = true) -> QString {
            ListedPaths listedPaths;
            for (const QString& path : {u"C:\\GAMES\\CHESS\\CHESS.EXE"_s, u"D:\\ARCADE\\PONG.EXE"_s})
                if (any)
                    listedPaths.append(path);
            return listedPaths.containsPiece(piece) ? u"yes"_s : u"no"_s;
        };
        const auto found = [](const QString& caption, const QString& path, const QString& typed) -> QString {
            return GameFinder::Query(typed).matches(GameFinder::MakeFindKey(caption, path)) ? u"yes"_s : u"no"_s;
        };
        // Played: Game 2 in 2020, alpha in 2024 (stored under a path in other letter case); edge's value is damaged.
        const auto sorted = [](ListOrder order) -> QString {
            TestEnvironment env;
            WriteFile(env.settingsFile(),
                "[PlayHistory]\nc:|games|game 2.exe=3,600,2020-05-01T10:00:00Z\n"
                "C:|GAMES|ALPHA.EXE=1,60,2024-01-01T00:00:00Z\nc:|games|edge.exe=1,2,yesterday\n");
            QList<GameEntry> list = named({u"zeta"_s, u"Éclair"_s, u"alpha"_s, u"Game 10"_s, u"Game 2"_s, u"edge"_s});
            ListOrders::Sort(list, order, PlayHistory::ReadAll());
            return captions(list);
        };
        // A damaged history value reads as never played; the next launch starts the count afresh.
        const auto damaged = [](const QString& value) -> QString {
            TestEnvironment env;
            const QString game = u"C:\\Games\\Chess.exe"_s;
            SaveSetting(AppTitle(), PlayHistory::Section, PlayHistory::KeyFor(game), value);
            const QString summary = PlayHistoryText::Summary(PlayHistory::Read(game));
            PlayHistory::RecordLaunch(game, QDateTime(QDate(2026, 11, 23), QTime(23, 15, 42), QTimeZone::utc()));
            return summary + u'|' + GetSetting(AppTitle(), PlayHistory::Section, PlayHistory::KeyFor(game));
        };
        const QString prefix = u"Исполняемый файл для игры"_s;
        QTest::newRow("russian prefix cut") << tidy(prefix + u" Chess"_s) << u"Chess"_s;
        QTest::newRow("prefix elsewhere kept") << tidy(u"A "_s + prefix) << u"A "_s + prefix;
        QTest::newRow("12 unbroken") << tidy(u"ABCDEFGHIJKL"_s) << u"ABCDEFGHIJKL"_s;
        QTest::newRow("13 broken after 12") << tidy(u"ABCDEFGHIJKLM"_s) << u"ABCDEFGHIJKL M"_s;
        QTest::newRow("blanks unbroken") << tidy(u"Solitaire Collection Deluxe"_s) << u"Solitaire Collection Deluxe"_s;
        QTest::newRow("30 kept") << tidy(u"Thirty characters long name ok"_s) << u"Thirty characters long name ok"_s;
        QTest::newRow("31 cut") << tidy(u"Thirty-one characters long name"_s) << u"Thirty-one characters long nam..."_s;
        QTest::newRow("zone table, any case") << zone(u"HRTZZM"_s) << u"Internet Chervi"_s;
        QTest::newRow("publisher game, built-in language") << zone(u"sudoku"_s) << QString();
        QTest::newRow("key, worked example") << cacheFile(u"C:\\G.exe"_s) << u"/c/G325331.ico"_s;
        QTest::newRow("key, eight-bit code") << cacheFile(u"é"_s) << u"/c/É2330.ico"_s;
        QTest::newRow("key, outside the code page") << cacheFile(u"ж"_s) << u"/c/Ж630.ico"_s;
        QTest::newRow("key, empty") << cacheFile(QString()) << u"/c/00.ico"_s;
        QTest::newRow("key, Russian") << cacheFile(u"/home/u/Игры/Пасьянс/game.exe"_s, "ru_RU")
                                      << u"/c/GAME20232107.ico"_s;
        QTest::newRow("key, Polish") << cacheFile(u"/home/u/Gry/Łódź/gra.exe"_s, "pl_PL") << u"/c/GRA11581272.ico"_s;
        QTest::newRow("upper-case extension") << names(u"GAME.EXE"_s) << u"11"_s;
        QTest::newRow("flash movie") << names(u"a.SWF"_s) << u"01"_s;
        QTest::newRow("extension inside name") << names(u"game.exe.txt"_s) << u"00"_s;
        QTest::newRow("dot in folder only") << names(u"dir.exe\\file"_s) << u"00"_s;
        QTest::newRow("program itself any case") << names(u"brimvault.EXE"_s) << u"01"_s;
        QTest::newRow("the service") << names(u"BrimvaultService.exe"_s) << u"01"_s;
        QTest::newRow("piece of uninst.exe") << names(u"t.exe"_s) << u"01"_s;
        QTest::newRow("setup any case") << names(u"GameSETUP.exe"_s) << u"01"_s;
        QTest::newRow("installer") << names(u"Install.exe"_s) << u"01"_s;
        QTest::newRow("similar but longer") << names(u"xuninst.exe"_s) << u"11"_s;
        QTest::newRow("nothing listed") << listed(u"C:\\A.EXE"_s, false) << u"no"_s;
        QTest::newRow("end of one and start of the next") << listed(u"EXE\tD:\\AR"_s) << u"yes"_s;
        QTest::newRow("leading tab") << listed(u"\tC:\\GAMES"_s) << u"yes"_s;
        QTest::newRow("other case") << listed(u"c:\\games"_s) << u"no"_s;
        QTest::newRow("every run present, order not") << listed(u"GAMESARCADE"_s) << u"no"_s;
        QTest::newRow("runs across two paths") << listed(u".EXED:\\A"_s) << u"no"_s;
        QTest::newRow("find, accents in caption")
            << found(u"Pokémon Café"_s, u"x.exe"_s, u"pokemon cafe"_s) << u"yes"_s;
        QTest::newRow("find, cyrillic yo and case") << found(u"Ёлочка"_s, u"x.exe"_s, u"ЕЛО"_s) << u"yes"_s;
        QTest::newRow("find, polish l") << found(u"Łódź Rally"_s, u"x.exe"_s, u"lodz"_s) << u"yes"_s;
        QTest::newRow("find, caption broken for wrapping")
            << found(u"SuperMarioBr os"_s, u"x.exe"_s, u"bros"_s) << u"yes"_s;
        QTest::newRow("find, two words of file name")
            << found(u"Racer"_s, u"/g/need_for_speed.exe"_s, u"for sp"_s) << u"yes"_s;
        QTest::newRow("find, capital starts a word")
            << found(u"X"_s, u"C:\\g\\HeroesOfMight.exe"_s, u"might"_s) << u"yes"_s;
        QTest::newRow("find, inside a file name word") << found(u"X"_s, u"C:\\g\\heroes.exe"_s, u"roes"_s) << u"no"_s;
        QTest::newRow("find, folder is not the name") << found(u"X"_s, u"C:\\speedy\\x.exe"_s, u"speed"_s) << u"no"_s;
        QTest::newRow("find, extension is not the name") << found(u"X"_s, u"C:\\g\\x.exe"_s, u"exe"_s) << u"no"_s;
        QTest::newRow("find, blanks find all") << found(u"Chess"_s, u"chess.exe"_s, u"   "_s) << u"yes"_s;
        QTest::newRow("order as found") << sorted(ListOrder::AsFound) << u"zeta,Éclair,alpha,Game 10,Game 2,edge"_s;
        QTest::newRow("order by name") << sorted(ListOrder::ByName) << u"alpha,Éclair,edge,Game 2,Game 10,zeta"_s;
        QTest::newRow("order recently played")
            << sorted(ListOrder::RecentlyPlayed) << u"alpha,Game 2,zeta,Éclair,Game 10,edge"_s;
        QTest::newRow("listing narrows after ordering") << captions(CatalogueListing::ShownEntries(
            named({u"Mine Sweeper"_s, u"Chess"_s, u"Minecart"_s}), u"mine"_s, ListOrder::ByName, {}))
                                                        << u"Mine Sweeper,Minecart"_s;
        QTest::newRow("history in words") << damaged(u"often"_s) << u"Never played|1,0,2026-11-23T23:15:42Z"_s;
        QTest::newRow("history, bad date")
            << damaged(u"3,120,2026-13-45T99:00:00Z"_s) << u"Never played|1,0,2026-11-23T23:15:42Z"_s;
    }
    void rules()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    void historyFollowsThePathWithoutCase()
    {
        PlayHistory::RecordLaunch(u"C:\\Games\\Chess.exe"_s, QDateTime::currentDateTimeUtc());
        PlayHistory::AddPlayTime(u" c:\\games\\CHESS.EXE"_s, 11520);
        PlayHistory::RecordLaunch(u"c:\\GAMES\\chess.exe"_s, QDateTime::currentDateTimeUtc());
        const PlayRecord record = PlayHistory::Read(u"C:\\Games\\Chess.exe"_s);
        QCOMPARE(record.launches, 2);
        QVERIFY(PlayHistoryText::Summary(record).endsWith(u", played for 3 h 12 min (2 times)"_s));
        QCOMPARE(PlayHistoryText::Duration(59 * 60 + 59), u"59 min"_s);
        PlayHistory::Forget(u"C:\\GAMES\\Chess.exe"_s);
        QVERIFY(PlayHistory::Read(u"C:\\Games\\Chess.exe"_s).isEmpty());
    }
};
BV_REGISTER_TEST(TestCatalogue);
#include "tst_catalogue.moc"
