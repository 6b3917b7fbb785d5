// What the service accepts before writing anything: entry names, packages, limits and its command line.
#include "PackageArchive.h"
#include "PackageLimits.h"
#include "PackageValidator.h"
#include "ServiceCommandLine.h"

#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Kind = EntryHeader::Kind;

namespace {

EntryHeader Entry(const QString& path, Kind kind = Kind::File, qint64 size = 10)
{
    return {.path = path, .kind = kind, .size = kind == Kind::Folder ? 0 : size, .modified = {}};
}

} // namespace

class TestPackageValidator : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void packages_data()
    {
        QTest::addColumn<QList<EntryHeader>>("entries");
        QTest::addColumn<QString>("refusal");
        const EntryHeader exe = Entry(u"Game/Game.exe"_s);
        const EntryHeader folder = Entry(u"Game/"_s, Kind::Folder);
        const auto named = [&](const QString& path) { return QList {exe, Entry(path)}; };
        QTest::newRow("plain") << named(u"Game/Données/.niveau"_s) << QString();
        QTest::newRow("empty") << named(QString()) << u"without a name"_s;
        QTest::newRow("absolute") << named(u"/etc/passwd"_s) << u"absolute path"_s;
        QTest::newRow("drive relative") << named(u"c:evil.exe"_s) << u"drive letter"_s;
        QTest::newRow("backslash") << named(u"Game\\..\\evil.exe"_s) << u"backslash"_s;
        QTest::newRow("parent") << named(u"Game/../../evil.exe"_s) << u"outside its folder"_s;
        QTest::newRow("double slash") << named(u"Game//Game.exe"_s) << u"empty folder part"_s;
        QTest::newRow("control character") << named(u"Game/a\nb.exe"_s) << u"not allowed"_s;
        QTest::newRow("wildcard") << named(u"Game/*.exe"_s) << u"not allowed"_s;
        QTest::newRow("trailing dot") << named(u"Game/Game.exe."_s) << u"not allowed"_s;
        QTest::newRow("trailing blank") << named(u"Game /Game.exe"_s) << u"not allowed"_s;
        QTest::newRow("device name") << named(u"Game/nul.txt"_s) << u"not allowed"_s;
        QTest::newRow("device com") << named(u"Game/COM3"_s) << u"not allowed"_s;
        QTest::newRow("not a device") << named(u"Game/COM0"_s) << QString();
        QTest::newRow("256 characters") << named((u"Game/"_s + QString(256, u'a'))) << u"too long"_s;
        QTest::newRow("255 characters") << named((u"Game/"_s + QString(255, u'a'))) << QString();
        QTest::newRow("with folder entries")
            << QList {folder, folder, exe, Entry(u"Game/data/"_s, Kind::Folder), Entry(u"Game/data/x"_s)} << QString();
        QTest::newRow("flash game") << QList {Entry(u"Game/movie.SWF"_s)} << QString();
        QTest::newRow("empty") << QList<EntryHeader> {} << u"empty"_s;
        QTest::newRow("no game file") << QList {Entry(u"Game/readme.txt"_s)} << u"no .exe or .swf"_s;
        QTest::newRow("game file only deeper") << QList {Entry(u"Game/bin/Game.exe"_s)} << u"no .exe or .swf"_s;
        QTest::newRow("game file is a folder")
            << QList {Entry(u"Game/Game.exe/"_s, Kind::Folder)} << u"no .exe or .swf"_s;
        QTest::newRow("top folders differ in case") << QList {exe, Entry(u"game/x"_s)} << u"more than one top-level"_s;
        QTest::newRow("file at the top") << QList {Entry(u"Game.exe"_s)} << u"outside the game's folder"_s;
        QTest::newRow("icons folder") << QList {Entry(u"icons/x.exe"_s)} << u"reserved"_s;
        QTest::newRow("hidden folder") << QList {Entry(u".bvxstaging/x.exe"_s)} << u"reserved"_s;
        QTest::newRow("hard link") << QList {exe, Entry(u"Game/link"_s, Kind::HardLink)} << u"hard link"_s;
        QTest::newRow("unreadable name") << QList {EntryHeader {
            .path = u"Game/Game.exe"_s, .pathReadable = false, .modified = {}}}
                                         << u"cannot be read"_s;
        QTest::newRow("encrypted") << QList {exe, EntryHeader {.path = u"Game/d"_s, .encrypted = true, .modified = {}}}
                                   << u"encrypted"_s;
        QTest::newRow("unknown size") << QList {exe,
            EntryHeader {.path = u"Game/d"_s, .sizeKnown = false, .modified = {}}}
                                      << u"valid size"_s;
        QTest::newRow("negative size") << QList {exe, Entry(u"Game/d"_s, Kind::File, -5)} << u"valid size"_s;
        QTest::newRow("same file in other case") << QList {exe, Entry(u"Game/GAME.EXE"_s)} << u"twice"_s;
        QTest::newRow("file then folder")
            << QList {exe, Entry(u"Game/data"_s), Entry(u"Game/data/x"_s)} << u"both as a file and as a folder"_s;
        QTest::newRow("folder then file")
            << QList {exe, Entry(u"Game/data/x"_s), Entry(u"Game/Data"_s)} << u"both as a file and as a folder"_s;
    }
    void packages()
    {
        QFETCH(QList<EntryHeader>, entries);
        QFETCH(QString, refusal);
        PackageValidator validator({}, 1 << 20);
        QString problem;
        for (qsizetype i = 0; problem.isEmpty() && i <= entries.size(); ++i)
            problem = i < entries.size() ? validator.addEntry(entries.at(i)) : validator.finish();
        // An empty refusal stands for acceptance.
        QVERIFY2(refusal.isEmpty() ? problem.isEmpty() : problem.contains(refusal), qPrintable(problem));
    }

    void planKeepsArchiveOrderAndTotals()
    {
        PackageValidator validator({.maxUnpackedBytes = 3000, .maxRatio = 200, .maxEntries = 4}, 2000);
        for (const EntryHeader& entry : {Entry(u"Game/"_s, Kind::Folder), Entry(u"Game/b.exe"_s, Kind::File, 1000),
                 Entry(u"Game/a.dat"_s, Kind::File, 2000)})
            QCOMPARE(validator.addEntry(entry), QString());
        QCOMPARE(validator.finish(), QString());
        const PackagePlan& plan = validator.plan();
        QCOMPARE(plan.gameFolder + u' ' + plan.entries.at(0).path + u' ' + plan.entries.at(2).path,
            u"Game Game Game/a.dat"_s);
        QVERIFY(plan.entries.at(0).folder);
        QCOMPARE(QList({plan.totalBytes, plan.fileCount, plan.entries.size()}), QList<qint64>({3000, 2, 3}));
        // One byte over the total, one entry over the count.
        QVERIFY(validator.addEntry(Entry(u"Game/c"_s, Kind::File, 1)).contains(u"limit of"));
        QCOMPARE(validator.addEntry(Entry(u"Game/c"_s, Kind::File, 0)), QString());
        QVERIFY(validator.addEntry(Entry(u"Game/d"_s, Kind::File, 0)).contains(u"more than 4 entries"));
    }

    // The ratio counts only once the package unpacks to more than a megabyte.
    void ratio()
    {
        const auto problem = [](qint64 unpacked, qint64 packed) {
            PackageValidator validator({.maxUnpackedBytes = qint64(1) << 40, .maxRatio = 10, .maxEntries = 10}, packed);
            const QString refusal = validator.addEntry(Entry(u"Game/Game.exe"_s, Kind::File, unpacked));
            return refusal.isEmpty() ? validator.finish() : refusal;
        };
        QCOMPARE(problem(1 << 20, 1), QString());
        QCOMPARE(problem(10 << 20, 1 << 20), QString());
        QVERIFY(problem(11 << 20, 1 << 20).contains(u"11 to 1"));
    }

    void limitsFromSettings()
    {
        TestEnvironment environment;
        const auto limits = [](const QString& megabytes, const QString& ratio) {
            SaveSetting(AppTitle(), u"Settings"_s, PackageLimitKeys::MaxUnpackedMegabytes, megabytes);
            SaveSetting(AppTitle(), u"Settings"_s, PackageLimitKeys::MaxCompressionRatio, ratio);
            return QList {PackageLimits::fromSettings().maxUnpackedBytes, PackageLimits::fromSettings().maxRatio};
        };
        const QList<qint64> defaults {qint64(8) << 30, 200};
        QCOMPARE(limits({}, {}), defaults);
        QCOMPARE(limits(u" 100 "_s, u"50"_s), QList<qint64>({qint64(100) << 20, 50}));
        QCOMPARE(limits(u"0"_s, u"-7"_s), defaults);
        QCOMPARE(limits(u"9000000000000000"_s, u"lots"_s), QList<qint64>({std::numeric_limits<qint64>::max(), 200}));
    }

    void commandLine_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<ServiceCommand::Kind>("kind");
        QTest::addColumn<QString>("package");
        using enum ServiceCommand::Kind;
        QTest::newRow("install") << QStringList {u"-I"_s, u"/tmp/a b.bvxpak"_s} << Install << u"/tmp/a b.bvxpak"_s;
        QTest::newRow("install lower case") << QStringList {u"-i"_s, u"x.bvxpak"_s} << Install << u"x.bvxpak"_s;
        QTest::newRow("install slash") << QStringList {u"/I"_s, u"x.bvxpak"_s} << Install << u"x.bvxpak"_s;
        QTest::newRow("install quoted") << QStringList {u"-I"_s, u"\"x y.bvxpak\""_s} << Install << u"x y.bvxpak"_s;
        QTest::newRow("install in pieces")
            << QStringList {u"-I"_s, u"My"_s, u"Game.bvxpak"_s} << Install << u"My Game.bvxpak"_s;
        QTest::newRow("install without package") << QStringList {u"-I"_s} << Usage << QString();
        QTest::newRow("install empty") << QStringList {u"-I"_s, u"\"\""_s} << Usage << QString();
        QTest::newRow("tidy") << QStringList {u"-U"_s} << Tidy << QString();
        QTest::newRow("tidy with extra") << QStringList {u"-U"_s, u"now"_s} << Usage << QString();
        QTest::newRow("after launch") << QStringList {u"-r"_s} << AfterLaunch << QString();
        QTest::newRow("pack") << QStringList {u"--pack"_s, u"dir"_s, u"o.bvxpak"_s} << Pack << u"o.bvxpak"_s;
        QTest::newRow("pack without output") << QStringList {u"--pack"_s, u"dir"_s} << Usage << QString();
        QTest::newRow("long unknown") << QStringList {u"-Install"_s, u"x"_s} << Usage << QString();
    }
    void commandLine()
    {
        QFETCH(QStringList, arguments);
        const ServiceCommand command = ParseServiceCommandLine(arguments);
        QTEST(command.kind, "kind");
        QTEST(command.package, "package");
    }
};
BV_REGISTER_TEST(TestPackageValidator);
#include "tst_packagevalidator.moc"
