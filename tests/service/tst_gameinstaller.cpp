#include "GameInstaller.h"
#include "PackageWriter.h"
#include "StagingArea.h"

#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "ServiceTestSupport.h"
#include "TestEnvironment.h"

#include <QtTest>

#include <memory>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using namespace ServiceTestSupport;

class TestGameInstaller : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void init();
    void cleanup();
    void phasesAndProgress();
    void cancelLeavesGamesFolderAsItWas_data();
    void cancelLeavesGamesFolderAsItWas();
    void refusalDoesNotCreateGamesFolder();
    void gameFolderInTheWay();
    void stagingLinkIsNotFollowed();

private:
    QString packGame(const QString& name, qsizetype dataBytes);

    std::unique_ptr<TestEnvironment> m_environment;
    QString m_games;
};

void TestGameInstaller::init()
{
    m_environment = std::make_unique<TestEnvironment>();
    m_games = QDir::cleanPath(DataFolders::GamesFolder());
}

void TestGameInstaller::cleanup()
{
    m_environment.reset();
}

QString TestGameInstaller::packGame(const QString& name, qsizetype dataBytes)
{
    const QString folder = m_environment->path(u"sources/"_s + name);
    writeFile(folder + u'/' + name + u".exe"_s, "MZ");
    writeFile(folder + u"/data/a.bin"_s, randomBytes(dataBytes, 9));
    writeFile(folder + u"/data/b.bin"_s, randomBytes(dataBytes, 10));
    const QString package = m_environment->path(name + u".bvxpak"_s);
    const QString problem = PackGameFolder(folder, package);
    return problem.isEmpty() ? package : QString();
}

void TestGameInstaller::phasesAndProgress()
{
    const QString package = packGame(u"Phases"_s, 3 * 1024 * 1024);
    QVERIFY(!package.isEmpty());
    QList<InstallPhase> phases;
    qint64 lastDone = -1;
    qint64 reportedTotal = 0;
    bool monotonic = true;
    const InstallResult result = InstallPackage(
        package,
        [&](qint64 done, qint64 total) {
            monotonic = monotonic && done > lastDone && done <= total;
            lastDone = done;
            reportedTotal = total;
            return true;
        },
        [&](InstallPhase phase, const QString&) { phases.append(phase); });
    QVERIFY2(result.succeeded(), qPrintable(result.problem));
    QVERIFY(result.signalled);
    QVERIFY(!result.replaced);
    QCOMPARE(result.installedPath, m_games + u"/Phases"_s);
    QCOMPARE(phases, QList({InstallPhase::Checking, InstallPhase::Unpacking, InstallPhase::Finishing}));
    QVERIFY(monotonic);
    QCOMPARE(reportedTotal, qint64(2 + 2 * 3 * 1024 * 1024));
    QCOMPARE(lastDone, reportedTotal);
    QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey), u"1"_s);
}

void TestGameInstaller::cancelLeavesGamesFolderAsItWas_data()
{
    QTest::addColumn<bool>("reinstall");
    QTest::newRow("new game") << false;
    QTest::newRow("reinstall") << true;
}

void TestGameInstaller::cancelLeavesGamesFolderAsItWas()
{
    QFETCH(bool, reinstall);
    QVERIFY(writeFile(m_games + u"/Other/Other.exe"_s, "MZ"));
    if (reinstall)
        QVERIFY(writeFile(m_games + u"/Cancel/Cancel.exe"_s, "MZ old"));
    const QString package = packGame(u"Cancel"_s, 2 * 1024 * 1024);
    QVERIFY(!package.isEmpty());
    const QStringList before = treeListing(m_games);

    int calls = 0;
    const InstallResult result = InstallPackage(package, [&](qint64 done, qint64 total) {
        ++calls;
        return done < total / 2;
    });
    QVERIFY(result.cancelled);
    QVERIFY(!result.succeeded());
    QVERIFY(!result.signalled);
    QVERIFY(calls > 1);
    QCOMPARE(treeListing(m_games), before);
    QVERIFY(!QFileInfo::exists(StagingFolderPath(m_games)));
}

void TestGameInstaller::refusalDoesNotCreateGamesFolder()
{
    QVERIFY(!QFileInfo::exists(m_games));
    const QString package = m_environment->path(u"nogame.bvxpak"_s);
    QVERIFY(craftPackage(u"nogame"_s, package));
    const InstallResult result = InstallPackage(package);
    QVERIFY(result.problem.contains(u"no .exe or .swf"));
    QVERIFY(!QFileInfo::exists(m_games));

    // One that fails while unpacking takes the folder it created with it too.
    QVERIFY(craftPackage(u"corrupt"_s, package));
    QVERIFY(InstallPackage(package).problem.contains(u"CRC"));
    QVERIFY(!QFileInfo::exists(m_games));
}

void TestGameInstaller::gameFolderInTheWay()
{
    QVERIFY(writeFile(m_games + u"/Blocked"_s, "a file, not a game folder"));
    const QString package = packGame(u"Blocked"_s, 1000);
    QVERIFY(!package.isEmpty());
    const QStringList before = treeListing(m_games);
    const InstallResult result = InstallPackage(package);
    QVERIFY2(result.problem.contains(u"not a game folder"), qPrintable(result.problem));
    QCOMPARE(treeListing(m_games), before);
}

void TestGameInstaller::stagingLinkIsNotFollowed()
{
    const QString elsewhere = m_environment->path(u"elsewhere"_s);
    QVERIFY(QDir().mkpath(elsewhere));
    QVERIFY(QDir().mkpath(m_games));
    QVERIFY(QFile::link(elsewhere, StagingFolderPath(m_games)));
    const QString package = packGame(u"Linked"_s, 1000);
    QVERIFY(!package.isEmpty());
    const QStringList before = treeListing(m_environment->root());

    const InstallResult result = InstallPackage(package);
    QVERIFY(!result.succeeded());
    QCOMPARE(treeListing(m_environment->root()), before);
}

QTEST_GUILESS_MAIN(TestGameInstaller)
#include "tst_gameinstaller.moc"
