#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "ServiceTestSupport.h"
#include "SmallFileSystem.h"
#include "TestEnvironment.h"

#include <QProcess>
#include <QtTest>

using namespace Brimvault;
using namespace ServiceTestSupport;

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
        QVERIFY(writeFile(source + QStringLiteral("/part%1.exe").arg(i), randomBytes(fileSize, quint32(i))));
    const QString package = environment.path(QStringLiteral("big.bvxpak"));
    QCOMPARE(runService({QStringLiteral("--pack"), source, package}).exitCode, 0);

    SmallFileSystem disk(environment.path(QStringLiteral("commonappdata")), options);
    QVERIFY2(disk.isMounted(), qPrintable(disk.error()));
    const QString games = DataFolders::GamesFolder();
    QVERIFY(writeFile(games + QStringLiteral("Existing/Existing.exe"), "MZ existing"));
    QVERIFY(SaveSetting(
        AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, QStringLiteral("0")));
    const QStringList before = treeListing(games);

    QProcess service;
    if (hideMountTable) {
        service.setProgram(QStringLiteral("unshare"));
        service.setArguments({QStringLiteral("--mount"), QStringLiteral("--propagation"), QStringLiteral("private"),
            QStringLiteral("sh"), QStringLiteral("-c"),
            QStringLiteral("mount -t tmpfs none /proc && exec \"$0\" \"$@\""), servicePath(), QStringLiteral("-I"),
            package});
        service.start();
    } else {
        startService(service, {QStringLiteral("-I"), package});
    }
    QVERIFY(service.waitForFinished(120000));
    const QString errors = QString::fromLocal8Bit(service.readAllStandardError());
    QCOMPARE(service.exitCode(), 1);
    QVERIFY2(errors.contains(QStringLiteral("not enough free space")) && errors.contains(reason), qPrintable(errors));
    QCOMPARE(treeListing(games), before);
    QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey),
        QStringLiteral("0"));
}

QTEST_GUILESS_MAIN(TestServiceDiskSpace)
#include "tst_servicediskspace.moc"
