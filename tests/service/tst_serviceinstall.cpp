#include "PackageLimits.h"
#include "StagingArea.h"

#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "ServiceTestSupport.h"
#include "TestEnvironment.h"

#include <QProcess>
#include <QtTest>

#include <memory>
#include <sys/stat.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using namespace ServiceTestSupport;

class TestServiceInstall : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void init();
    void cleanup();
    void packedGameInstalls();
    void refused_data();
    void refused();
    void pipeEntryLandsAsPlainFile();
    void reinstallReplacesOnlyWhenComplete();
    void reinstallMatchesFolderInAnyCase();
    void concurrentInstallsBothLand();
    void packRefused_data();
    void packRefused();
    void badCommandLine_data();
    void badCommandLine();

private:
    QString signal() const;
    QString makeGame(const QString& name, const QList<QPair<QString, QByteArray>>& files) const;
    QString pack(const QString& folder, const QString& packageName) const;

    std::unique_ptr<TestEnvironment> m_environment;
    QString m_games;
    QString m_packages;
};

void TestServiceInstall::init()
{
    m_environment = std::make_unique<TestEnvironment>();
    m_games = QDir::cleanPath(DataFolders::GamesFolder());
    m_packages = m_environment->path(u"packages"_s);
    QVERIFY(QDir().mkpath(m_packages));
    QVERIFY(writeFile(m_games + u"/Existing/Existing.exe"_s, "MZ existing"));
    QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s));
}

void TestServiceInstall::cleanup()
{
    m_environment.reset();
}

QString TestServiceInstall::signal() const
{
    return GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s);
}

QString TestServiceInstall::makeGame(const QString& name, const QList<QPair<QString, QByteArray>>& files) const
{
    const QString folder
        = m_environment->path(u"sources/"_s + QString::number(qHash(name + files.first().first))) + u'/' + name;
    for (const auto& [relative, bytes] : files)
        writeFile(folder + u'/' + relative, bytes);
    return folder;
}

QString TestServiceInstall::pack(const QString& folder, const QString& packageName) const
{
    const QString package = m_packages + u'/' + packageName;
    const ServiceRun run = runService({u"--pack"_s, folder, package});
    return run.finished && run.exitCode == 0 ? package : QString();
}

void TestServiceInstall::packedGameInstalls()
{
    const QString source = makeGame(u"Space Rocks"_s,
        {{u"Space Rocks.exe"_s, "MZ rocks"}, {u"Space Rocks.bvxinf"_s, "<Name>Space Rocks"},
            {u"Space Rocks.ico"_s, QByteArray(766, '\1')}, {u"Données/niveau 1.dat"_s, randomBytes(300000, 1)},
            {u"empty.txt"_s, QByteArray()}});
    QVERIFY(QDir(source).mkpath(u"saves"_s));
    const QString package = pack(source, u"rocks.bvxpak"_s);
    QVERIFY(!package.isEmpty());

    const ServiceRun run = runService({u"-I"_s, package});
    QVERIFY2(run.finished && run.exitCode == 0, qPrintable(run.standardError));
    QCOMPARE(treeListing(m_games + u"/Space Rocks"_s), treeListing(source));
    QCOMPARE(signal(), u"1"_s);
    const QStringList games = QDir(m_games).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot);
    QCOMPARE(games, QStringList({u"Existing"_s, u"Space Rocks"_s}));
}

void TestServiceInstall::refused_data()
{
    QTest::addColumn<QString>("kind");
    QTest::addColumn<QStringList>("settings"); // key, value, ...
    QTest::addColumn<QString>("reason");

    QTest::newRow("absolute path") << u"absolute"_s << QStringList() << u"absolute path"_s;
    QTest::newRow("drive letter") << u"drive"_s << QStringList() << u"drive letter"_s;
    QTest::newRow("dot dot") << u"dotdot"_s << QStringList() << u"outside its folder"_s;
    QTest::newRow("backslash") << u"backslash"_s << QStringList() << u"backslash"_s;
    QTest::newRow("symbolic link") << u"symlink"_s << QStringList() << u"symbolic link"_s;
    QTest::newRow("device") << u"device"_s << QStringList() << u"special file"_s;
    QTest::newRow("two top folders") << u"twotop"_s << QStringList() << u"more than one top-level folder"_s;
    QTest::newRow("file beside the folder") << u"rootfile"_s << QStringList() << u"outside the game's folder"_s;
    QTest::newRow("no game file") << u"nogame"_s << QStringList() << u"no .exe or .swf"_s;
    QTest::newRow("reserved folder") << u"reserved"_s << QStringList() << u"reserved"_s;
    QTest::newRow("over the size limit") << u"big"_s << QStringList {PackageLimitKeys::MaxUnpackedMegabytes, u"2"_s}
                                         << u"limit of 2 MB"_s;
    QTest::newRow("over the ratio limit") << u"ratio"_s << QStringList() << u"to 1, beyond the limit"_s;
    QTest::newRow("not enough space") << u"huge"_s
                                      << QStringList {PackageLimitKeys::MaxUnpackedMegabytes, u"1000000000000"_s,
                                             PackageLimitKeys::MaxCompressionRatio, u"1000000000000000"_s}
                                      << u"not enough free space"_s;
    QTest::newRow("not a zip") << u"notzip"_s << QStringList() << u"not a game package"_s;
    QTest::newRow("empty file") << u"empty"_s << QStringList() << u"not a game package"_s;
    QTest::newRow("truncated") << u"truncated"_s << QStringList() << u"damaged"_s;
    QTest::newRow("bad checksum") << u"corrupt"_s << QStringList() << u"CRC"_s;
    QTest::newRow("size header lies") << u"liar"_s << QStringList() << u"larger than its header says"_s;
    QTest::newRow("missing package") << QString() << QStringList() << u"cannot be found"_s;
}

void TestServiceInstall::refused()
{
    QFETCH(QString, kind);
    QFETCH(QStringList, settings);
    QFETCH(QString, reason);

    for (qsizetype i = 0; i + 1 < settings.size(); i += 2)
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, settings.at(i), settings.at(i + 1)));
    const QString package = m_packages + u"/package.bvxpak"_s;
    if (!kind.isEmpty())
        QVERIFY(craftPackage(kind, package));

    const QStringList before = treeListing(m_environment->root());
    const ServiceRun run = runService({u"-I"_s, package});
    QVERIFY(run.finished);
    QCOMPARE(run.exitCode, 1);
    QVERIFY2(run.standardError.contains(reason), qPrintable(run.standardError));
    QCOMPARE(treeListing(m_environment->root()), before);
    QCOMPARE(signal(), u"0"_s);
}

// libarchive reads a ZIP member marked as a pipe as a plain file (an old Info-Zip habit); it must never
// become a pipe on disk.
void TestServiceInstall::pipeEntryLandsAsPlainFile()
{
    const QString package = m_packages + u"/pipe.bvxpak"_s;
    QVERIFY(craftPackage(u"fifo"_s, package));
    const ServiceRun run = runService({u"-I"_s, package});
    QVERIFY2(run.finished && run.exitCode == 0, qPrintable(run.standardError));
    struct stat status { };
    QCOMPARE(::lstat(QFile::encodeName(m_games + u"/Game/pipe"_s).constData(), &status), 0);
    QVERIFY(S_ISREG(status.st_mode));
}

void TestServiceInstall::reinstallReplacesOnlyWhenComplete()
{
    const QString first = makeGame(u"Game"_s, {{u"Game.exe"_s, "MZ one"}, {u"old.dat"_s, "old"}});
    const QString firstPackage = pack(first, u"one.bvxpak"_s);
    QVERIFY(!firstPackage.isEmpty());
    QCOMPARE(runService({u"-I"_s, firstPackage}).exitCode, 0);
    const QStringList installed = treeListing(m_games);

    const QString second
        = makeGame(u"Game"_s, {{u"Game.exe"_s, "MZ two"}, {u"new.dat"_s, randomBytes(2 * 1024 * 1024, 2)}});
    const QString secondPackage = pack(second, u"two.bvxpak"_s);
    QVERIFY(!secondPackage.isEmpty());

    // Damage the last member's data so the unpacking fails late, with most of the new copy written.
    QFile damaged(secondPackage);
    QVERIFY(damaged.open(QIODevice::ReadOnly));
    QByteArray bytes = damaged.readAll();
    damaged.close();
    const qsizetype middle = bytes.indexOf("Game/new.dat") + 1024 * 1024 + 512 * 1024;
    for (qsizetype i = middle; i < middle + 256; ++i)
        bytes[i] = char(bytes[i] ^ 0x33);
    const QString brokenPackage = m_packages + u"/broken.bvxpak"_s;
    QVERIFY(writeFile(brokenPackage, bytes));

    QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s));
    const ServiceRun broken = runService({u"-I"_s, brokenPackage});
    QCOMPARE(broken.exitCode, 1);
    QVERIFY2(broken.standardError.contains(u"damaged"), qPrintable(broken.standardError));
    QCOMPARE(treeListing(m_games), installed);
    QCOMPARE(signal(), u"0"_s);

    const ServiceRun good = runService({u"-I"_s, secondPackage});
    QVERIFY2(good.exitCode == 0, qPrintable(good.standardError));
    QCOMPARE(treeListing(m_games + u"/Game"_s), treeListing(second));
    QCOMPARE(signal(), u"1"_s);
    QCOMPARE(QDir(m_games).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot),
        QStringList({u"Existing"_s, u"Game"_s}));
}

void TestServiceInstall::reinstallMatchesFolderInAnyCase()
{
    const QString source = makeGame(u"EXISTING"_s, {{u"Existing.exe"_s, "MZ new"}});
    const QString package = pack(source, u"upper.bvxpak"_s);
    QVERIFY(!package.isEmpty());
    QCOMPARE(runService({u"-I"_s, package}).exitCode, 0);
    QCOMPARE(
        QDir(m_games).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot), QStringList({u"EXISTING"_s}));
    QCOMPARE(treeListing(m_games + u"/EXISTING"_s), treeListing(source));
}

void TestServiceInstall::concurrentInstallsBothLand()
{
    constexpr qsizetype Megabyte = 1024 * 1024;
    const QString north = makeGame(u"North"_s,
        {{u"North.exe"_s, "MZ north"}, {u"a.dat"_s, randomBytes(12 * Megabyte, 3)},
            {u"b.dat"_s, randomBytes(12 * Megabyte, 4)}});
    const QString south = makeGame(u"South"_s,
        {{u"South.exe"_s, "MZ south"}, {u"a.dat"_s, randomBytes(12 * Megabyte, 5)},
            {u"b.dat"_s, randomBytes(12 * Megabyte, 6)}});
    const QString northPackage = pack(north, u"north.bvxpak"_s);
    const QString southPackage = pack(south, u"south.bvxpak"_s);
    QVERIFY(!northPackage.isEmpty() && !southPackage.isEmpty());

    QProcess first;
    QProcess second;
    startService(first, {u"-I"_s, northPackage});
    startService(second, {u"-I"_s, southPackage});
    QVERIFY(first.waitForFinished(120000));
    QVERIFY(second.waitForFinished(120000));
    const QString firstErrors = QString::fromLocal8Bit(first.readAllStandardError());
    QCOMPARE(first.exitCode(), 0);
    QCOMPARE(second.exitCode(), 0);
    // Large packages report their progress on standard error when there is no display.
    QVERIFY2(firstErrors.contains(u"Unpacking: 100%"), qPrintable(firstErrors));

    QCOMPARE(treeListing(m_games + u"/North"_s), treeListing(north));
    QCOMPARE(treeListing(m_games + u"/South"_s), treeListing(south));
    QCOMPARE(QDir(m_games).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot),
        QStringList({u"Existing"_s, u"North"_s, u"South"_s}));
    QCOMPARE(signal(), u"1"_s);
}

void TestServiceInstall::packRefused_data()
{
    QTest::addColumn<QString>("problemKind");
    QTest::addColumn<QString>("reason");

    QTest::newRow("missing folder") << u"missing"_s << u"does not exist"_s;
    QTest::newRow("no game file") << u"nogame"_s << u"no .exe or .swf"_s;
    QTest::newRow("game file only deeper") << u"deeper"_s << u"no .exe or .swf"_s;
    QTest::newRow("symbolic link") << u"symlink"_s << u"link or special file"_s;
    QTest::newRow("package inside the folder") << u"inside"_s << u"inside the game folder"_s;
}

void TestServiceInstall::packRefused()
{
    QFETCH(QString, problemKind);
    QFETCH(QString, reason);

    const QString folder = m_environment->path(u"sources/Game"_s);
    QString package = m_packages + u"/out.bvxpak"_s;
    if (problemKind != u"missing") {
        QVERIFY(writeFile(folder + u"/readme.txt"_s, "hello"));
        if (problemKind == u"deeper")
            QVERIFY(writeFile(folder + u"/bin/Game.exe"_s, "MZ"));
        if (problemKind == u"symlink" || problemKind == u"inside")
            QVERIFY(writeFile(folder + u"/Game.exe"_s, "MZ"));
        if (problemKind == u"symlink")
            QVERIFY(QFile::link(m_environment->settingsFile(), folder + u"/settings.ini"_s));
        if (problemKind == u"inside")
            package = folder + u"/out.bvxpak"_s;
    }
    const ServiceRun run = runService({u"--pack"_s, folder, package});
    QCOMPARE(run.exitCode, 1);
    QVERIFY2(run.standardError.contains(reason), qPrintable(run.standardError));
    QVERIFY(!QFileInfo::exists(package));
    QVERIFY(QDir(m_packages).isEmpty(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot));
}

void TestServiceInstall::badCommandLine_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::newRow("nothing") << QStringList();
    QTest::newRow("unknown switch") << QStringList {u"-X"_s};
    QTest::newRow("install without package") << QStringList {u"-I"_s};
    QTest::newRow("tidy with extra") << QStringList {u"-U"_s, u"now"_s};
    QTest::newRow("pack without output") << QStringList {u"--pack"_s, u"folder"_s};
}

void TestServiceInstall::badCommandLine()
{
    QFETCH(QStringList, arguments);
    const QStringList before = treeListing(m_environment->root());
    const ServiceRun run = runService(arguments);
    QCOMPARE(run.exitCode, 2);
    QVERIFY(run.standardError.contains(u"Usage"));
    QCOMPARE(treeListing(m_environment->root()), before);
}

QTEST_GUILESS_MAIN(TestServiceInstall)
#include "tst_serviceinstall.moc"
