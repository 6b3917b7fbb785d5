#include "PackageLimits.h"

#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "Packages.h"
#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QProcess>

#include <sys/stat.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Files = QList<QPair<QString, QByteArray>>;

// The real service installs and packs real packages in a temporary tree.
class TestServiceInstall : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString m_games;
    QString m_packages;

    static QString signal()
    {
        return GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s);
    }
    static bool resetSignal()
    {
        return SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"0"_s);
    }
    QStringList gameFolders() const
    {
        return QDir(m_games).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot);
    }
    QString makeGame(const QString& name, const Files& files) const
    {
        const QString folder
            = m_env->path(u"sources/"_s + QString::number(qHash(name + files.first().first))) + u'/' + name;
        for (const auto& [relative, bytes] : files)
            WriteFile(folder + u'/' + relative, bytes);
        return folder;
    }
    // The package the service packs from the folder, or "" when it refused.
    QString pack(const QString& folder, const QString& packageName) const
    {
        const QString package = m_packages + u'/' + packageName;
        return RunService({u"--pack"_s, folder, package}, nullptr) == 0 ? package : QString();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_games = QDir::cleanPath(DataFolders::GamesFolder());
        m_packages = m_env->path(u"packages"_s);
        QVERIFY(QDir().mkpath(m_packages));
        QVERIFY(WriteFile(m_games + u"/Existing/Existing.exe"_s, "MZ existing"));
        QVERIFY(resetSignal());
    }
    void cleanup() { m_env.reset(); }

    void packedGameInstalls()
    {
        const QString source = makeGame(u"Space Rocks"_s,
            {{u"Space Rocks.exe"_s, "MZ rocks"}, {u"Space Rocks.bvxinf"_s, "<Name>Space Rocks"},
                {u"Données/niveau 1.dat"_s, RandomBytes(300000, 1)}, {u"empty.txt"_s, QByteArray()}});
        QVERIFY(QDir(source).mkpath(u"saves"_s));
        const QString package = pack(source, u"rocks.bvxpak"_s);
        QVERIFY(!package.isEmpty());
        QString output;
        QCOMPARE(RunService({u"-I"_s, package}, &output), 0);
        QCOMPARE(SnapshotTree(m_games + u"/Space Rocks"_s), SnapshotTree(source));
        QCOMPARE(signal(), u"1"_s);
        QCOMPARE(gameFolders(), QStringList({u"Existing"_s, u"Space Rocks"_s}));
    }

    // Refused before anything is written; the name rules themselves are the validator's table.
    void refused_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::addColumn<QStringList>("settings"); // key, value, ...
        QTest::addColumn<QString>("reason");
        const QStringList none;
        QTest::newRow("absolute path") << u"absolute"_s << none << u"absolute path"_s;
        QTest::newRow("dot dot") << u"dotdot"_s << none << u"outside its folder"_s;
        QTest::newRow("backslash") << u"backslash"_s << none << u"backslash"_s;
        QTest::newRow("symbolic link") << u"symlink"_s << none << u"symbolic link"_s;
        QTest::newRow("device") << u"device"_s << none << u"special file"_s;
        QTest::newRow("over the size limit")
            << u"big"_s << QStringList {PackageLimitKeys::MaxUnpackedMegabytes, u"2"_s} << u"limit of 2 MB"_s;
        QTest::newRow("over the ratio limit") << u"ratio"_s << none << u"to 1, beyond the limit"_s;
        QTest::newRow("not enough space") << u"huge"_s
                                          << QStringList {PackageLimitKeys::MaxUnpackedMegabytes, u"1000000000000"_s,
                                                 PackageLimitKeys::MaxCompressionRatio, u"1000000000000000"_s}
                                          << u"not enough free space"_s;
        QTest::newRow("not a zip") << u"notzip"_s << none << u"not a game package"_s;
        QTest::newRow("empty file") << u"empty"_s << none << u"not a game package"_s;
        QTest::newRow("truncated") << u"truncated"_s << none << u"damaged"_s;
        QTest::newRow("bad checksum") << u"corrupt"_s << none << u"CRC"_s;
        QTest::newRow("size header lies") << u"liar"_s << none << u"larger than its header says"_s;
        QTest::newRow("missing package") << QString() << none << u"cannot be found"_s;
    }
    void refused()
    {
        QFETCH(QString, kind);
        QFETCH(QStringList, settings);
        QFETCH(QString, reason);
        for (qsizetype i = 0; i + 1 < settings.size(); i += 2)
            QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, settings.at(i), settings.at(i + 1)));
        const QString package = m_packages + u"/package.bvxpak"_s;
        if (!kind.isEmpty())
            QVERIFY2(CraftPackage(kind, package), "python3 could not write the package");
        const auto before = SnapshotTree(m_env->root());
        QString output;
        QCOMPARE(RunService({u"-I"_s, package}, &output), 1);
        QVERIFY2(output.contains(reason), qPrintable(output));
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }

    // libarchive reads a ZIP member marked as a pipe as a plain file; it must never become a pipe on disk.
    void pipeEntryLandsAsPlainFile()
    {
        const QString package = m_packages + u"/pipe.bvxpak"_s;
        QVERIFY(CraftPackage(u"fifo"_s, package));
        QCOMPARE(RunService({u"-I"_s, package}, nullptr), 0);
        struct stat status { };
        QCOMPARE(::lstat(QFile::encodeName(m_games + u"/Game/pipe"_s).constData(), &status), 0);
        QVERIFY(S_ISREG(status.st_mode));
    }

    void reinstallReplacesOnlyWhenComplete()
    {
        const QString first = makeGame(u"Game"_s, {{u"Game.exe"_s, "MZ one"}, {u"old.dat"_s, "old"}});
        QCOMPARE(RunService({u"-I"_s, pack(first, u"one.bvxpak"_s)}, nullptr), 0);
        const auto installed = SnapshotTree(m_games);
        const QString second
            = makeGame(u"Game"_s, {{u"Game.exe"_s, "MZ two"}, {u"new.dat"_s, RandomBytes(2 << 20, 2)}});
        const QString secondPackage = pack(second, u"two.bvxpak"_s);
        QVERIFY(!secondPackage.isEmpty());

        // Damage the last member's data so the unpacking fails late, with most of the new copy written.
        QByteArray bytes = ReadFile(secondPackage);
        const qsizetype middle = bytes.indexOf("Game/new.dat") + (3 << 19);
        for (qsizetype i = middle; i < middle + 256; ++i)
            bytes[i] = char(bytes[i] ^ 0x33);
        QVERIFY(WriteFile(m_packages + u"/broken.bvxpak"_s, bytes));
        QVERIFY(resetSignal());
        QString output;
        QCOMPARE(RunService({u"-I"_s, m_packages + u"/broken.bvxpak"_s}, &output), 1);
        QVERIFY2(output.contains(u"damaged"), qPrintable(output));
        QCOMPARE(SnapshotTree(m_games), installed);
        QCOMPARE(signal(), u"0"_s);

        QCOMPARE(RunService({u"-I"_s, secondPackage}, nullptr), 0);
        QCOMPARE(SnapshotTree(m_games + u"/Game"_s), SnapshotTree(second));
        QCOMPARE(signal(), u"1"_s);
        QCOMPARE(gameFolders(), QStringList({u"Existing"_s, u"Game"_s}));
    }

    void reinstallMatchesFolderInAnyCase()
    {
        const QString source = makeGame(u"EXISTING"_s, {{u"Existing.exe"_s, "MZ new"}});
        QCOMPARE(RunService({u"-I"_s, pack(source, u"upper.bvxpak"_s)}, nullptr), 0);
        QCOMPARE(gameFolders(), QStringList({u"EXISTING"_s}));
        QCOMPARE(SnapshotTree(m_games + u"/EXISTING"_s), SnapshotTree(source));
    }

    void concurrentInstallsBothLand()
    {
        const QString north = makeGame(u"North"_s,
            {{u"North.exe"_s, "MZ north"}, {u"a.dat"_s, RandomBytes(12 << 20, 3)},
                {u"b.dat"_s, RandomBytes(12 << 20, 4)}});
        const QString south = makeGame(u"South"_s,
            {{u"South.exe"_s, "MZ south"}, {u"a.dat"_s, RandomBytes(12 << 20, 5)},
                {u"b.dat"_s, RandomBytes(12 << 20, 6)}});
        const QString northPackage = pack(north, u"north.bvxpak"_s);
        const QString southPackage = pack(south, u"south.bvxpak"_s);
        QVERIFY(!northPackage.isEmpty() && !southPackage.isEmpty());
        QProcess first;
        QProcess second;
        first.start(ServicePath(), {u"-I"_s, northPackage});
        second.start(ServicePath(), {u"-I"_s, southPackage});
        QVERIFY(first.waitForFinished(120000) && second.waitForFinished(120000));
        QCOMPARE(first.exitCode(), 0);
        QCOMPARE(second.exitCode(), 0);
        // Large packages report their progress on standard error when there is no display.
        QVERIFY(first.readAllStandardError().contains("Unpacking: 100%"));
        QCOMPARE(SnapshotTree(m_games + u"/North"_s), SnapshotTree(north));
        QCOMPARE(SnapshotTree(m_games + u"/South"_s), SnapshotTree(south));
        QCOMPARE(gameFolders(), QStringList({u"Existing"_s, u"North"_s, u"South"_s}));
        QCOMPARE(signal(), u"1"_s);
    }

    void packRefused_data()
    {
        QTest::addColumn<QStringList>("files"); // below the game folder; none: the folder is missing
        QTest::addColumn<bool>("packageInside");
        QTest::addColumn<QString>("reason");
        QTest::newRow("missing folder") << QStringList() << false << u"does not exist"_s;
        QTest::newRow("no game file") << QStringList {u"readme.txt"_s} << false << u"no .exe or .swf"_s;
        QTest::newRow("game file only deeper") << QStringList {u"bin/Game.exe"_s} << false << u"no .exe or .swf"_s;
        QTest::newRow("symbolic link") << QStringList {u"Game.exe"_s, u"settings.ini"_s} << false
                                       << u"link or special file"_s;
        QTest::newRow("package inside the folder")
            << QStringList {u"Game.exe"_s} << true << u"inside the game folder"_s;
    }
    void packRefused()
    {
        QFETCH(QStringList, files);
        QFETCH(bool, packageInside);
        QFETCH(QString, reason);
        const QString folder = m_env->path(u"sources/Game"_s);
        for (const QString& file : files)
            QVERIFY(file == u"settings.ini" ? QFile::link(m_env->settingsFile(), folder + u'/' + file)
                                            : WriteFile(folder + u'/' + file));
        const QString package = (packageInside ? folder : m_packages) + u"/out.bvxpak"_s;
        QString output;
        QCOMPARE(RunService({u"--pack"_s, folder, package}, &output), 1);
        QVERIFY2(output.contains(reason), qPrintable(output));
        QVERIFY(!QFileInfo::exists(package));
        QVERIFY(QDir(m_packages).isEmpty(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot));
    }

    // What each command line means is the parser's table; here the real service on a wrong one.
    void badCommandLine_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::newRow("nothing") << QStringList();
        QTest::newRow("unknown switch") << QStringList {u"-X"_s};
    }
    void badCommandLine()
    {
        QFETCH(QStringList, arguments);
        const auto before = SnapshotTree(m_env->root());
        QString output;
        QCOMPARE(RunService(arguments, &output), 2);
        QVERIFY(output.contains(u"Usage"));
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }
};
BV_REGISTER_TEST(TestServiceInstall);
#include "tst_serviceinstall.moc"
