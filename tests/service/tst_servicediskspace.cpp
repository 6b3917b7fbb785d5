#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "ProgramRun.h"
#include "SmallFileSystem.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QProcess>
#include <QtTest>

using namespace Brimvault;

// The real service installing into a games folder on a small file system of its own.
class TestServiceDiskSpace : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void packageLargerThanTheDisk_data();
    void packageLargerThanTheDisk();
};

void TestServiceDiskSpace::packageLargerThanTheDisk_data()
{
    QTest::addColumn<QString>("options");
    QTest::addColumn<bool>("hideMountTable");
    QTest::addColumn<int>("files");
    QTest::addColumn<int>("fileSize");
    QTest::addColumn<QString>("reason");
    // Without /proc the mount table says nothing of the games folder, as in a fresh chroot.
    QTest::newRow("asked before unpacking, no mount table")
        << QStringLiteral("size=8m") << true << 1 << 12 * 1024 * 1024 << QStringLiteral("MB are free");
    // Room in bytes but not in files: the disk fills while unpacking.
    QTest::newRow("full while unpacking")
        << QStringLiteral("size=64m,nr_inodes=16") << false << 40 << 1024 << QStringLiteral("not enough free space");
}

void TestServiceDiskSpace::packageLargerThanTheDisk()
{
    QFETCH(QString, options);
    QFETCH(bool, hideMountTable);
    QFETCH(int, files);
    QFETCH(int, fileSize);
    QFETCH(QString, reason);

    TestEnvironment environment;
    const QString source = environment.path(QStringLiteral("source/Big Game"));
    for (int i = 0; i < files; ++i)
        QVERIFY(WriteFile(source + QStringLiteral("/part%1.exe").arg(i), RandomBytes(fileSize, quint32(i))));
    const QString package = environment.path(QStringLiteral("big.bvxpak"));
    QCOMPARE(RunService({QStringLiteral("--pack"), source, package}, nullptr), 0);

    SmallFileSystem disk(environment.path(QStringLiteral("commonappdata")), options);
    QVERIFY2(disk.isMounted(), qPrintable(disk.error()));
    const QString games = DataFolders::GamesFolder();
    QVERIFY(WriteFile(games + QStringLiteral("Existing/Existing.exe"), "MZ existing"));
    QVERIFY(SaveSetting(
        AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, QStringLiteral("0")));
    const auto before = SnapshotTree(games);

    QProcess service;
    const QStringList install {QStringLiteral("-I"), package};
    if (hideMountTable)
        service.start(QStringLiteral("unshare"),
            QStringList {QStringLiteral("--mount"), QStringLiteral("--propagation"), QStringLiteral("private"),
                QStringLiteral("sh"), QStringLiteral("-c"),
                QStringLiteral("mount -t tmpfs none /proc && exec \"$0\" \"$@\""), ServicePath()}
                + install);
    else
        service.start(ServicePath(), install);
    QVERIFY(service.waitForFinished(120000));
    const QString errors = QString::fromLocal8Bit(service.readAllStandardError());
    QCOMPARE(service.exitCode(), 1);
    QVERIFY2(errors.contains(QStringLiteral("not enough free space")) && errors.contains(reason), qPrintable(errors));
    QVERIFY(SnapshotTree(games) == before);
    QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey),
        QStringLiteral("0"));
}

BV_REGISTER_TEST(TestServiceDiskSpace);
#include "tst_servicediskspace.moc"
