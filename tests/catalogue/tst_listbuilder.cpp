#include "catalogue/IconCacheBuilder.h"
#include "catalogue/IconCacheKey.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
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
#include <QtEndian>

using namespace Brimvault;
using namespace Qt::StringLiterals;
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

} // namespace

#define REQUIRE_PE(fixture, path) REQUIRE_FIXTURE(CopyFixture(PeFixture(fixture), path), "the PE fixtures (mingw-w64)")

// The entries of the list, the icons built for them in the background, and the listing on the command line.
class TestListBuilder : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString game(const QString& name = u"game.exe"_s) const { return m_env->path(u"games/"_s + name); }

private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }
    void init() { m_env = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_env.reset(); }

    void entries_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        // A game file (plain, or a copy of a built fixture: pe/<name> or catalogue/<name>) with a user's name and
        // an info file. The user's name belongs to the entry whose path matches after trimming and in any case;
        // of a name key written twice by hand the first counts.
        const auto caption = [](const QString& fileName, const QString& fixture, const QByteArray& userName = {},
                                 const QByteArray& info = {}) -> QString {
            TestEnvironment env;
            const QString path = env.path(u"games/"_s + fileName);
            const QString built
                = fixture.startsWith(u"pe/") ? PeFixture(fixture.mid(3)) : CatalogueFixture(fixture.mid(10));
            if (fixture.isEmpty() ? !WriteFile(path) : !CopyFixture(built, path))
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
        QTest::newRow("info file of another language only")
            << caption(u"game.exe"_s, {}, {}, "<>Name_RUS<Igra") << u"game"_s;
        QTest::newRow("zone member without row falls to version")
            << caption(u"zm.exe"_s, u"pe/multi64.exe"_s) << u"Marble Cascade"_s;
        QTest::newRow("long version text trimmed, cut and broken")
            << caption(u"long.exe"_s, u"catalogue/long_desc.exe"_s) << u"SuperMegaUlt raExtremeHyp erDelu..."_s;
        QTest::newRow("version without description")
            << caption(u"nodesc.exe"_s, u"pe/ver_nodesc64.exe"_s) << u"nodesc"_s;
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

    void buildIcon_data()
    {
        QTest::addColumn<QString>("fixture"); // "" for a plain file
        QTest::addColumn<bool>("dataFolderExists");
        QTest::addColumn<Outcome>("outcome");
        QTest::addColumn<bool>("cached");
        QTest::newRow("64-bit with icon") << u"multi64.exe"_s << true << Outcome::Extracted << true;
        QTest::newRow("cache folder's parent missing") << u"multi64.exe"_s << false << Outcome::Extracted << false;
        QTest::newRow("without icon") << u"nores64.exe"_s << true << Outcome::NoIcon << false;
        QTest::newRow("not an executable") << QString() << true << Outcome::NoIcon << false;
    }
    void buildIcon()
    {
        QFETCH(QString, fixture);
        QFETCH(bool, dataFolderExists);
        QFETCH(Outcome, outcome);
        QFETCH(bool, cached);
        if (fixture.isEmpty())
            QVERIFY(WriteFile(game(), QByteArray(4096, 'x')));
        else
            REQUIRE_PE(fixture, game());
        if (dataFolderExists)
            QVERIFY(QDir().mkpath(m_env->path(u"commonappdata/Brimvault"_s)));
        const IconCacheBuilder::Result result = IconCacheBuilder(DataFolders::IconsFolder()).BuildIcon(game());
        QCOMPARE(result.outcome, outcome);
        QCOMPARE(result.picture.isNull(), outcome == Outcome::NoIcon);
        QCOMPARE(result.cacheFile, cacheOf(game()));
        QCOMPARE(result.saved && QFileInfo::exists(result.cacheFile), cached);
        QCOMPARE(QFileInfo::exists(m_env->path(u"commonappdata/Brimvault"_s)), dataFolderExists);
    }

    // A good cache file is used as it is even when the game changed; a damaged one is replaced.
    void cacheFile()
    {
        REQUIRE_PE(u"multi64.exe"_s, game());
        QVERIFY(WriteFile(cacheOf(game()), QByteArray("\0\0\1\0\1\0", 6)));
        const IconCacheBuilder builder(DataFolders::IconsFolder());
        const IconCacheBuilder::Result first = builder.BuildIcon(game());
        QVERIFY(first.outcome == Outcome::Extracted && QFileInfo(cacheOf(game())).size() > 6);
        REQUIRE_PE(u"nores64.exe"_s, game());
        const IconCacheBuilder::Result second = builder.BuildIcon(game());
        QVERIFY(second.outcome == Outcome::FromCache && !second.saved);
        QCOMPARE(second.picture, first.picture);
    }

    void onePerTick()
    {
        QVERIFY(QDir().mkpath(DataFolders::GamesFolder()));
        const QStringList games {game(u"one.exe"_s), game(u"two.exe"_s)};
        IconCacheBuilder builder(DataFolders::IconsFolder());
        for (qsizetype i = 0; i < games.size(); ++i) {
            REQUIRE_PE(u"multi64.exe"_s, games.at(i));
            builder.enqueue(games.at(i), quint64(100 + i));
        }
        // Closing stops the work before the next game.
        QVERIFY(!builder.Tick(true) && builder.pending() == 2);
        const auto first = builder.Tick(false);
        QVERIFY(first && first->ticket == 100 && first->path == games.at(0));
        QCOMPARE(first->result.outcome, Outcome::Extracted);
        QVERIFY(builder.pending() == 1 && QFileInfo::exists(cacheOf(games.at(0))));
        QVERIFY(!QFileInfo::exists(cacheOf(games.at(1))));
        const auto second = builder.Tick(false);
        QVERIFY(second && second->ticket == 101 && builder.pending() == 0 && !builder.Tick(false));
    }

    // The program's --list and --json output, read as a user's script would.
    void listing()
    {
        const QString program = m_env->programDir();
        const QString games = DataFolders::GamesFolder();
        const QString added = m_env->path(u"mine/Added Game.exe"_s);
        REQUIRE_PE(u"multi64.exe"_s, games + u"Marble/marble.exe"_s);
        QVERIFY(WriteFile(games + u"Marble/marble.bvxinf"_s, "<>Name<Marble Everywhere\r\n<>Name_TST<Marble In Test"));
        QVERIFY(WriteFile(games + u"movie.swf"_s) && WriteFile(m_env->path(u"windows/sol.exe"_s)) && WriteFile(added));
        QVERIFY(WriteFile(m_env->settingsFile(),
            QString(u"[Files]\nFile3="_s + added + u"\nFile5="_s + m_env->path(u"mine/hrtzzm.exe"_s)
                + u"\n[FilesNames]\nFileName3=Renamed\n"_s)
                .toUtf8()));
        // Without a stored language the window's start-up would store one; the listing must not.
        const auto before = SnapshotTree(m_env->root());
        const auto [jsonExit, json] = run({u"--list"_s, u"--json"_s});
        QCOMPARE(jsonExit, 0);
        QCOMPARE(SnapshotTree(m_env->root()), before);
        QStringList items;
        for (const QJsonValue& value : QJsonDocument::fromJson(json).array()) {
            const QJsonObject object = value.toObject();
            QCOMPARE(object.size(), 6);
            items.append(object.value(u"caption"_s).toString() + u'\t' + object.value(u"path"_s).toString() + u'\t'
                + object.value(u"icon"_s).toString());
        }
        QCOMPARE(items.size(), 6);
        QVERIFY(items.first().endsWith(u"\thttp://127.0.0.1:9/online-games-catalog.asp\tonline"_s));
        QCOMPARE(items.mid(1, 3),
            QStringList({u"movie\t"_s + games + u"movie.swf\tflash"_s,
                u"Marble Everywhere\t"_s + games + u"Marble/marble.exe\tqueued"_s,
                u"sol\t"_s + m_env->path(u"windows/sol.exe"_s) + u"\tqueued"_s}));

        QVERIFY(WriteFile(program + u"/Brimvault_Test.lng"_s,
            "#language=Testish\n#charset=204\n@1250=Online Test\n@2030=Test Chervi\n"));
        QVERIFY(SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, u"Brimvault_Test.lng"_s)
            && SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngNik"_s, u"TST"_s));
        const auto [textExit, text] = run({u"--list"_s});
        QCOMPARE(textExit, 0);
        QCOMPARE(run({u"--list"_s, u"--json"_s, u"--xml"_s}), qMakePair(2, QByteArray()));
        // The games folder's own files first, then its folders, the classic games, the added ones.
        QCOMPARE(QString::fromUtf8(text).split(u'\n'),
            QStringList({u"Online Test\thttp://127.0.0.1:9/online-games-catalog.asp"_s,
                u"movie\t"_s + games + u"movie.swf"_s, u"Marble In Test\t"_s + games + u"Marble/marble.exe"_s,
                u"sol\t"_s + m_env->path(u"windows/sol.exe"_s), u"Renamed\t"_s + added,
                u"Test Chervi\t"_s + m_env->path(u"mine/hrtzzm.exe"_s), QString()}));
    }
};
BV_REGISTER_TEST(TestListBuilder);
#include "tst_listbuilder.moc"
