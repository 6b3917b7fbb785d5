#include "PackageArchive.h"
#include "PackageLimits.h"
#include "PackageValidator.h"

#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Kind = EntryHeader::Kind;

namespace {

EntryHeader Entry(const QString& path, Kind kind = Kind::File, qint64 size = 10)
{
    EntryHeader entry;
    entry.path = path;
    entry.kind = kind;
    entry.size = kind == Kind::Folder ? 0 : size;
    return entry;
}

// Feeds the entries in order; the first refusal, or finish()'s answer.
QString Validate(const QList<EntryHeader>& entries, const PackageLimits& limits = {}, qint64 packageBytes = 1 << 20)
{
    PackageValidator validator(limits, packageBytes);
    for (const EntryHeader& entry : entries)
        if (const QString problem = validator.addEntry(entry); !problem.isEmpty())
            return problem;
    return validator.finish();
}

} // namespace

#define COMPARE_REFUSAL(problem, refusal)                                                                              \
    QVERIFY2(refusal.isEmpty() ? problem.isEmpty() : problem.contains(refusal), qPrintable(problem))

class TestPackageValidator : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void entryNames_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("refusal"); // empty: accepted
        QTest::newRow("plain") << u"Game/Game.exe"_s << QString();
        QTest::newRow("unicode") << u"Jeu/Données/niveau.dat"_s << QString();
        QTest::newRow("dotted name") << u"Game/.config"_s << QString();
        QTest::newRow("empty") << QString() << u"without a name"_s;
        QTest::newRow("absolute") << u"/etc/passwd"_s << u"absolute path"_s;
        QTest::newRow("drive letter") << u"C:/Windows/evil.exe"_s << u"drive letter"_s;
        QTest::newRow("drive relative") << u"c:evil.exe"_s << u"drive letter"_s;
        QTest::newRow("stream") << u"Game/Game.exe:hidden"_s << u"not allowed"_s;
        QTest::newRow("backslash") << u"Game\\..\\evil.exe"_s << u"backslash"_s;
        QTest::newRow("parent") << u"Game/../../evil.exe"_s << u"outside its folder"_s;
        QTest::newRow("current") << u"./Game/Game.exe"_s << u"outside its folder"_s;
        QTest::newRow("double slash") << u"Game//Game.exe"_s << u"empty folder part"_s;
        QTest::newRow("control character") << u"Game/a\nb.exe"_s << u"not allowed"_s;
        QTest::newRow("wildcard") << u"Game/*.exe"_s << u"not allowed"_s;
        QTest::newRow("trailing dot") << u"Game/Game.exe."_s << u"not allowed"_s;
        QTest::newRow("trailing blank") << u"Game /Game.exe"_s << u"not allowed"_s;
        QTest::newRow("device name") << u"Game/nul.txt"_s << u"not allowed"_s;
        QTest::newRow("device com") << u"Game/COM3"_s << u"not allowed"_s;
        QTest::newRow("not a device") << u"Game/COM0"_s << QString();
        QTest::newRow("256 characters") << (u"Game/"_s + QString(256, u'a')) << u"too long"_s;
        QTest::newRow("255 characters") << (u"Game/"_s + QString(255, u'a')) << QString();
    }
    void entryNames()
    {
        QFETCH(QString, path);
        QFETCH(QString, refusal);
        const QString problem = PackageValidator::pathProblem(path);
        COMPARE_REFUSAL(problem, refusal);
    }

    void packages_data()
    {
        QTest::addColumn<QList<EntryHeader>>("entries");
        QTest::addColumn<QString>("refusal");
        const EntryHeader exe = Entry(u"Game/Game.exe"_s);
        const EntryHeader folder = Entry(u"Game/"_s, Kind::Folder);
        const auto with = [](EntryHeader entry, auto change) { return change(entry), entry; };
        QTest::newRow("with folder entries")
            << QList {folder, exe, Entry(u"Game/data/"_s, Kind::Folder), Entry(u"Game/data/x"_s)} << QString();
        QTest::newRow("flash game") << QList {Entry(u"Game/movie.SWF"_s)} << QString();
        QTest::newRow("empty") << QList<EntryHeader> {} << u"empty"_s;
        QTest::newRow("no game file") << QList {Entry(u"Game/readme.txt"_s)} << u"no .exe or .swf"_s;
        QTest::newRow("game file only deeper") << QList {Entry(u"Game/bin/Game.exe"_s)} << u"no .exe or .swf"_s;
        QTest::newRow("game file is a folder")
            << QList {Entry(u"Game/Game.exe/"_s, Kind::Folder)} << u"no .exe or .swf"_s;
        QTest::newRow("top folders differ in case") << QList {exe, Entry(u"game/x"_s)} << u"more than one top-level"_s;
        QTest::newRow("file at the top") << QList {Entry(u"Game.exe"_s)} << u"outside the game's folder"_s;
        QTest::newRow("file at the top later") << QList {exe, Entry(u"setup.exe"_s)} << u"outside the game's folder"_s;
        QTest::newRow("icons folder") << QList {Entry(u"icons/x.exe"_s)} << u"reserved"_s;
        QTest::newRow("advertising folder") << QList {Entry(u"Reclama/x.exe"_s)} << u"reserved"_s;
        QTest::newRow("hidden folder") << QList {Entry(u".bvxstaging/x.exe"_s)} << u"reserved"_s;
        QTest::newRow("symbolic link") << QList {exe, Entry(u"Game/link"_s, Kind::SymbolicLink)} << u"symbolic link"_s;
        QTest::newRow("hard link") << QList {exe, Entry(u"Game/link"_s, Kind::HardLink)} << u"hard link"_s;
        QTest::newRow("special") << QList {exe, Entry(u"Game/fifo"_s, Kind::Special)} << u"special file"_s;
        QTest::newRow("unreadable name") << QList {with(exe, [](EntryHeader& e) { e.pathReadable = false; })}
                                         << u"cannot be read"_s;
        QTest::newRow("encrypted") << QList {exe, with(Entry(u"Game/d"_s), [](EntryHeader& e) { e.encrypted = true; })}
                                   << u"encrypted"_s;
        QTest::newRow("unknown size") << QList {exe,
            with(Entry(u"Game/d"_s), [](EntryHeader& e) { e.sizeKnown = false; })}
                                      << u"valid size"_s;
        QTest::newRow("negative size") << QList {exe, Entry(u"Game/d"_s, Kind::File, -5)} << u"valid size"_s;
        QTest::newRow("same file in other case") << QList {exe, Entry(u"Game/GAME.EXE"_s)} << u"twice"_s;
        QTest::newRow("same folder twice") << QList {folder, folder, exe} << QString();
        QTest::newRow("file then folder")
            << QList {exe, Entry(u"Game/data"_s), Entry(u"Game/data/x"_s)} << u"both as a file and as a folder"_s;
        QTest::newRow("folder then file")
            << QList {exe, Entry(u"Game/data/x"_s), Entry(u"Game/Data"_s)} << u"both as a file and as a folder"_s;
        QTest::newRow("explicit folder then file") << QList {exe, Entry(u"Game/data/"_s, Kind::Folder),
            Entry(u"Game/data"_s)} << u"both as a file and as a folder"_s;
    }
    void packages()
    {
        QFETCH(QList<EntryHeader>, entries);
        QFETCH(QString, refusal);
        const QString problem = Validate(entries);
        COMPARE_REFUSAL(problem, refusal);
    }

    void planKeepsArchiveOrderAndTotals()
    {
        PackageLimits limits;
        limits.maxUnpackedBytes = 3000;
        limits.maxEntries = 4;
        PackageValidator validator(limits, 2000);
        QCOMPARE(validator.addEntry(Entry(u"Game/"_s, Kind::Folder)), QString());
        QCOMPARE(validator.addEntry(Entry(u"Game/b.exe"_s, Kind::File, 1000)), QString());
        QCOMPARE(validator.addEntry(Entry(u"Game/a.dat"_s, Kind::File, 2000)), QString());
        QCOMPARE(validator.finish(), QString());
        const PackagePlan& plan = validator.plan();
        QCOMPARE(plan.gameFolder, u"Game"_s);
        QCOMPARE(plan.totalBytes, 3000);
        QCOMPARE(plan.fileCount, 2);
        QCOMPARE(plan.entries.size(), 3);
        QCOMPARE(plan.entries.at(0).path, u"Game"_s);
        QVERIFY(plan.entries.at(0).folder);
        QCOMPARE(plan.entries.at(2).path, u"Game/a.dat"_s);
        // One byte over the total, one entry over the count.
        QVERIFY(validator.addEntry(Entry(u"Game/c"_s, Kind::File, 1)).contains(u"limit of"));
        QCOMPARE(validator.addEntry(Entry(u"Game/c"_s, Kind::File, 0)), QString());
        QVERIFY(validator.addEntry(Entry(u"Game/d"_s, Kind::File, 0)).contains(u"more than 4 entries"));
    }

    // The ratio counts only once the package unpacks to more than a megabyte.
    void ratio()
    {
        PackageLimits limits;
        limits.maxRatio = 10;
        QVERIFY(Validate({Entry(u"Game/Game.exe"_s, Kind::File, 1 << 20)}, limits, 1).isEmpty());
        QVERIFY(Validate({Entry(u"Game/Game.exe"_s, Kind::File, 10 << 20)}, limits, 1 << 20).isEmpty());
        QVERIFY(Validate({Entry(u"Game/Game.exe"_s, Kind::File, 11 << 20)}, limits, 1 << 20).contains(u"11 to 1"));
    }

    void limitsFromSettings_data()
    {
        QTest::addColumn<QString>("megabytes");
        QTest::addColumn<QString>("ratio");
        QTest::addColumn<qint64>("expectedBytes");
        QTest::addColumn<qint64>("expectedRatio");
        const qint64 eightGigabytes = qint64(8) << 30;
        QTest::newRow("absent: 8 GB, 200 to 1") << QString() << QString() << eightGigabytes << qint64(200);
        QTest::newRow("set") << u" 100 "_s << u"50"_s << (qint64(100) << 20) << qint64(50);
        QTest::newRow("zero keeps default") << u"0"_s << u"0"_s << eightGigabytes << qint64(200);
        QTest::newRow("negative keeps default") << u"-1"_s << u"-7"_s << eightGigabytes << qint64(200);
        QTest::newRow("text keeps default") << u"lots"_s << u"1e3"_s << eightGigabytes << qint64(200);
        QTest::newRow("huge saturates") << u"9000000000000000"_s << u"9000000000000000"_s
                                        << std::numeric_limits<qint64>::max() << qint64(9000000000000000);
    }
    void limitsFromSettings()
    {
        QFETCH(QString, megabytes);
        QFETCH(QString, ratio);
        TestEnvironment environment;
        if (!megabytes.isNull())
            QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, PackageLimitKeys::MaxUnpackedMegabytes, megabytes));
        if (!ratio.isNull())
            QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, PackageLimitKeys::MaxCompressionRatio, ratio));
        const PackageLimits limits = PackageLimits::fromSettings();
        QTEST(limits.maxUnpackedBytes, "expectedBytes");
        QTEST(limits.maxRatio, "expectedRatio");
    }

    void garbageIsDamaged()
    {
        const QByteArray bytes("PK\x03\x04 this is not really a zip archive at all", 45);
        PackageArchive archive;
        archive.openMemory(bytes.constData(), size_t(bytes.size()));
        PackagePlan plan;
        const QString problem = ValidatePackage(archive, PackageLimits(), bytes.size(), plan);
        QVERIFY2(problem.contains(u"damaged"), qPrintable(problem));
        QVERIFY(plan.entries.isEmpty());
    }
};
BV_REGISTER_TEST(TestPackageValidator);
#include "tst_packagevalidator.moc"
