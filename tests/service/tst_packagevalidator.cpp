#include "PackageArchive.h"
#include "PackageLimits.h"
#include "PackageValidator.h"

#include "store/SettingsStore.h"

#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

using Kind = EntryHeader::Kind;

EntryHeader header(const QString& path, Kind kind = Kind::File, qint64 size = 10)
{
    EntryHeader h;
    h.path = path;
    h.kind = kind;
    h.size = kind == Kind::Folder ? 0 : size;
    return h;
}

EntryHeader folder(const QString& path)
{
    return header(path, Kind::Folder);
}

// Feeds the entries in order; the first refusal, or finish()'s answer.
QString validate(const QList<EntryHeader>& entries, const PackageLimits& limits = {}, qint64 packageBytes = 1 << 20)
{
    PackageValidator validator(limits, packageBytes);
    for (const EntryHeader& entry : entries) {
        const QString problem = validator.addEntry(entry);
        if (!problem.isEmpty())
            return problem;
    }
    return validator.finish();
}

} // namespace

class TestPackageValidator : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void entryNames_data();
    void entryNames();
    void packages_data();
    void packages();
    void planKeepsArchiveOrderAndTotals();
    void limitsFromSettings_data();
    void limitsFromSettings();
    void garbageIsDamaged();
};

void TestPackageValidator::entryNames_data()
{
    QTest::addColumn<QString>("path");
    QTest::addColumn<QString>("refusal"); // empty: accepted

    QTest::newRow("plain") << u"Game/Game.exe"_s << QString();
    QTest::newRow("nested") << u"Game/data/levels/1.dat"_s << QString();
    QTest::newRow("unicode") << u"Jeu/Données/niveau.dat"_s << QString();
    QTest::newRow("dotted name") << u"Game/.config"_s << QString();
    QTest::newRow("empty") << QString() << u"without a name"_s;
    QTest::newRow("absolute") << u"/etc/passwd"_s << u"absolute path"_s;
    QTest::newRow("drive letter") << u"C:/Windows/evil.exe"_s << u"drive letter"_s;
    QTest::newRow("drive relative") << u"c:evil.exe"_s << u"drive letter"_s;
    QTest::newRow("stream") << u"Game/Game.exe:hidden"_s << u"not allowed"_s;
    QTest::newRow("backslash") << u"Game\\..\\evil.exe"_s << u"backslash"_s;
    QTest::newRow("unc") << u"\\\\server\\share\\x"_s << u"backslash"_s;
    QTest::newRow("parent") << u"Game/../../evil.exe"_s << u"outside its folder"_s;
    QTest::newRow("parent at end") << u"Game/.."_s << u"outside its folder"_s;
    QTest::newRow("current") << u"./Game/Game.exe"_s << u"outside its folder"_s;
    QTest::newRow("double slash") << u"Game//Game.exe"_s << u"empty folder part"_s;
    QTest::newRow("control character") << u"Game/a\nb.exe"_s << u"not allowed"_s;
    QTest::newRow("wildcard") << u"Game/*.exe"_s << u"not allowed"_s;
    QTest::newRow("trailing dot") << u"Game/Game.exe."_s << u"not allowed"_s;
    QTest::newRow("trailing blank") << u"Game /Game.exe"_s << u"not allowed"_s;
    QTest::newRow("device name") << u"Game/nul.txt"_s << u"not allowed"_s;
    QTest::newRow("device com") << u"Game/COM3"_s << u"not allowed"_s;
    QTest::newRow("not a device") << u"Game/COM0"_s << QString();
    QTest::newRow("long name") << (u"Game/"_s + QString(256, u'a')) << u"too long"_s;
    QTest::newRow("longest name") << (u"Game/"_s + QString(255, u'a')) << QString();
}

void TestPackageValidator::entryNames()
{
    QFETCH(QString, path);
    QFETCH(QString, refusal);
    const QString problem = PackageValidator::pathProblem(path);
    if (refusal.isEmpty())
        QVERIFY2(problem.isEmpty(), qPrintable(problem));
    else
        QVERIFY2(problem.contains(refusal), qPrintable(problem));
}

void TestPackageValidator::packages_data()
{
    QTest::addColumn<QList<EntryHeader>>("entries");
    QTest::addColumn<QString>("refusal");

    const EntryHeader exe = header(u"Game/Game.exe"_s);
    QTest::newRow("minimal") << QList {exe} << QString();
    QTest::newRow("with folder entries") << QList {folder(u"Game/"_s), exe, folder(u"Game/data/"_s),
        header(u"Game/data/x"_s)} << QString();
    QTest::newRow("flash game") << QList {header(u"Game/movie.SWF"_s)} << QString();
    QTest::newRow("empty") << QList<EntryHeader> {} << u"empty"_s;
    QTest::newRow("no game file") << QList {header(u"Game/readme.txt"_s)} << u"no .exe or .swf"_s;
    QTest::newRow("game file only deeper") << QList {header(u"Game/bin/Game.exe"_s)} << u"no .exe or .swf"_s;
    QTest::newRow("game file is a folder") << QList {folder(u"Game/Game.exe/"_s)} << u"no .exe or .swf"_s;
    QTest::newRow("two top folders") << QList {exe, header(u"Other/Other.exe"_s)} << u"more than one top-level"_s;
    QTest::newRow("top folders differ in case") << QList {exe, header(u"game/x"_s)} << u"more than one top-level"_s;
    QTest::newRow("file at the top") << QList {header(u"Game.exe"_s)} << u"outside the game's folder"_s;
    QTest::newRow("file at the top later") << QList {exe, header(u"setup.exe"_s)} << u"outside the game's folder"_s;
    QTest::newRow("icons folder") << QList {header(u"icons/x.exe"_s)} << u"reserved"_s;
    QTest::newRow("advertising folder") << QList {header(u"Reclama/x.exe"_s)} << u"reserved"_s;
    QTest::newRow("hidden folder") << QList {header(u".bvxstaging/x.exe"_s)} << u"reserved"_s;
    QTest::newRow("symbolic link") << QList {exe, header(u"Game/link"_s, Kind::SymbolicLink)} << u"symbolic link"_s;
    QTest::newRow("hard link") << QList {exe, header(u"Game/link"_s, Kind::HardLink)} << u"hard link"_s;
    QTest::newRow("special") << QList {exe, header(u"Game/fifo"_s, Kind::Special)} << u"special file"_s;
    EntryHeader unreadable = exe;
    unreadable.pathReadable = false;
    QTest::newRow("unreadable name") << QList {unreadable} << u"cannot be read"_s;
    EntryHeader encrypted = header(u"Game/data"_s);
    encrypted.encrypted = true;
    QTest::newRow("encrypted") << QList {exe, encrypted} << u"encrypted"_s;
    EntryHeader sizeless = header(u"Game/data"_s);
    sizeless.sizeKnown = false;
    QTest::newRow("unknown size") << QList {exe, sizeless} << u"valid size"_s;
    QTest::newRow("negative size") << QList {exe, header(u"Game/data"_s, Kind::File, -5)} << u"valid size"_s;
    QTest::newRow("same file twice") << QList {exe, exe} << u"twice"_s;
    QTest::newRow("same file in other case") << QList {exe, header(u"Game/GAME.EXE"_s)} << u"twice"_s;
    QTest::newRow("same folder twice") << QList {folder(u"Game/"_s), folder(u"Game/"_s), exe} << QString();
    QTest::newRow("file then folder") << QList {exe, header(u"Game/data"_s), header(u"Game/data/x"_s)}
                                      << u"both as a file and as a folder"_s;
    QTest::newRow("folder then file") << QList {exe, header(u"Game/data/x"_s), header(u"Game/Data"_s)}
                                      << u"both as a file and as a folder"_s;
    QTest::newRow("explicit folder then file")
        << QList {exe, folder(u"Game/data/"_s), header(u"Game/data"_s)} << u"both as a file and as a folder"_s;
}

void TestPackageValidator::packages()
{
    QFETCH(QList<EntryHeader>, entries);
    QFETCH(QString, refusal);
    const QString problem = validate(entries);
    if (refusal.isEmpty())
        QVERIFY2(problem.isEmpty(), qPrintable(problem));
    else
        QVERIFY2(problem.contains(refusal), qPrintable(problem));
}

void TestPackageValidator::planKeepsArchiveOrderAndTotals()
{
    PackageLimits limits;
    limits.maxUnpackedBytes = 3000;
    limits.maxEntries = 4;
    limits.maxRatio = 10;

    PackageValidator validator(limits, 2000);
    QCOMPARE(validator.addEntry(folder(u"Game/"_s)), QString());
    QCOMPARE(validator.addEntry(header(u"Game/b.exe"_s, Kind::File, 1000)), QString());
    QCOMPARE(validator.addEntry(header(u"Game/a.dat"_s, Kind::File, 2000)), QString());
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
    QVERIFY(validator.addEntry(header(u"Game/c"_s, Kind::File, 1)).contains(u"limit of"));
    QCOMPARE(validator.addEntry(header(u"Game/c"_s, Kind::File, 0)), QString());
    QVERIFY(validator.addEntry(header(u"Game/d"_s, Kind::File, 0)).contains(u"more than 4 entries"));

    // The ratio counts only once the package unpacks to more than a megabyte.
    limits = PackageLimits();
    limits.maxRatio = 10;
    QVERIFY(validate({header(u"Game/Game.exe"_s, Kind::File, 1 << 20)}, limits, 1).isEmpty());
    QVERIFY(validate({header(u"Game/Game.exe"_s, Kind::File, 11 << 20)}, limits, 1 << 20).contains(u"11 to 1"));
    QVERIFY(validate({header(u"Game/Game.exe"_s, Kind::File, 10 << 20)}, limits, 1 << 20).isEmpty());
}

void TestPackageValidator::limitsFromSettings_data()
{
    QTest::addColumn<QString>("megabytes");
    QTest::addColumn<QString>("ratio");
    QTest::addColumn<qint64>("expectedBytes");
    QTest::addColumn<qint64>("expectedRatio");

    const PackageLimits defaults;
    QTest::newRow("absent") << QString() << QString() << defaults.maxUnpackedBytes << defaults.maxRatio;
    QTest::newRow("set") << u" 100 "_s << u"50"_s << qint64(100) * 1024 * 1024 << qint64(50);
    QTest::newRow("zero keeps default") << u"0"_s << u"0"_s << defaults.maxUnpackedBytes << defaults.maxRatio;
    QTest::newRow("negative keeps default") << u"-1"_s << u"-7"_s << defaults.maxUnpackedBytes << defaults.maxRatio;
    QTest::newRow("text keeps default") << u"lots"_s << u"1e3"_s << defaults.maxUnpackedBytes << defaults.maxRatio;
    QTest::newRow("huge saturates") << u"9000000000000000"_s << u"9000000000000000"_s
                                    << std::numeric_limits<qint64>::max() << qint64(9000000000000000);
}

void TestPackageValidator::limitsFromSettings()
{
    QFETCH(QString, megabytes);
    QFETCH(QString, ratio);
    QFETCH(qint64, expectedBytes);
    QFETCH(qint64, expectedRatio);

    TestEnvironment environment;
    if (!megabytes.isNull())
        QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, PackageLimitKeys::MaxUnpackedMegabytes, megabytes));
    if (!ratio.isNull())
        QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, PackageLimitKeys::MaxCompressionRatio, ratio));
    const PackageLimits limits = PackageLimits::fromSettings();
    QCOMPARE(limits.maxUnpackedBytes, expectedBytes);
    QCOMPARE(limits.maxRatio, expectedRatio);
}

void TestPackageValidator::garbageIsDamaged()
{
    const QByteArray bytes("PK\x03\x04 this is not really a zip archive at all", 45);
    PackageArchive archive;
    archive.openMemory(bytes.constData(), size_t(bytes.size()));
    PackagePlan plan;
    const QString problem = ValidatePackage(archive, PackageLimits(), bytes.size(), plan);
    QVERIFY2(problem.contains(u"damaged"), qPrintable(problem));
    QVERIFY(plan.entries.isEmpty());
}

QTEST_GUILESS_MAIN(TestPackageValidator)
#include "tst_packagevalidator.moc"
