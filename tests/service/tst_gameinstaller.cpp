#include "GameInstaller.h"
#include "PackageWriter.h"
#include "StagingArea.h"

#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "Packages.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestGameInstaller : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString m_games;

    // A game with two data files of the given size, packed; "" when packing failed.
    QString packGame(const QString& name, qsizetype dataBytes) const
    {
        const QString folder = m_env->path(u"sources/"_s + name);
        const bool written = WriteFile(folder + u'/' + name + u".exe"_s)
            && WriteFile(folder + u"/data/a.bin"_s, RandomBytes(dataBytes, 9))
            && WriteFile(folder + u"/data/b.bin"_s, RandomBytes(dataBytes, 10));
        const QString package = m_env->path(name + u".bvxpak"_s);
        return written && PackGameFolder(folder, package).isEmpty() ? package : QString();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_games = QDir::cleanPath(DataFolders::GamesFolder());
    }
    void cleanup() { m_env.reset(); }

    void phasesAndProgress()
    {
        const QString package = packGame(u"Phases"_s, 3 << 20);
        QVERIFY(!package.isEmpty());
        QList<InstallPhase> phases;
        QList<qint64> done;
        qint64 total = 0;
        const InstallResult result = InstallPackage(
            package, [&](qint64 bytes, qint64 of) { return done.append(bytes), total = of, true; },
            [&](InstallPhase phase, const QString&) { phases.append(phase); });
        QVERIFY2(result.succeeded(), qPrintable(result.problem));
        QVERIFY(result.signalled && !result.replaced);
        QCOMPARE(result.installedPath, m_games + u"/Phases"_s);
        QCOMPARE(phases, QList({InstallPhase::Checking, InstallPhase::Unpacking, InstallPhase::Finishing}));
        // "MZ" and two files of 3 MB, counted up to the end.
        QCOMPARE(total, qint64(2 + 2 * (3 << 20)));
        QCOMPARE(done.last(), total);
        for (qsizetype i = 1; i < done.size(); ++i)
            QVERIFY(done.at(i) > done.at(i - 1));
        QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey), u"1"_s);
    }

    void cancelLeavesGamesFolderAsItWas_data()
    {
        QTest::addColumn<bool>("reinstall");
        QTest::newRow("new game") << false;
        QTest::newRow("reinstall") << true;
    }
    void cancelLeavesGamesFolderAsItWas()
    {
        QFETCH(bool, reinstall);
        QVERIFY(WriteFile(m_games + u"/Other/Other.exe"_s));
        if (reinstall)
            QVERIFY(WriteFile(m_games + u"/Cancel/Cancel.exe"_s, "MZ old"));
        const QString package = packGame(u"Cancel"_s, 2 << 20);
        QVERIFY(!package.isEmpty());
        const auto before = SnapshotTree(m_games);
        int calls = 0;
        const InstallResult result
            = InstallPackage(package, [&](qint64 done, qint64 total) { return ++calls, done < total / 2; });
        QVERIFY(result.cancelled && !result.succeeded() && !result.signalled);
        QVERIFY(calls > 1);
        QCOMPARE(SnapshotTree(m_games), before);
        QVERIFY(!QFileInfo::exists(StagingFolderPath(m_games)));
    }

    // Refused at the check or while unpacking, the games folder it created goes with it.
    void refusalDoesNotCreateGamesFolder_data()
    {
        QTest::addColumn<QString>("kind");
        QTest::addColumn<QString>("problem");
        QTest::newRow("no game file") << u"nogame"_s << u"no .exe or .swf"_s;
        QTest::newRow("bad checksum") << u"corrupt"_s << u"CRC"_s;
    }
    void refusalDoesNotCreateGamesFolder()
    {
        QFETCH(QString, kind);
        QFETCH(QString, problem);
        const QString package = m_env->path(u"package.bvxpak"_s);
        QVERIFY2(CraftPackage(kind, package), "python3 could not write the package");
        const InstallResult result = InstallPackage(package);
        QVERIFY2(result.problem.contains(problem), qPrintable(result.problem));
        QVERIFY(!QFileInfo::exists(m_games));
    }

    // A file where the game's folder goes, or a staging folder that is a link: nothing anywhere changes.
    void nothingChanges_data()
    {
        QTest::addColumn<bool>("stagingLink");
        QTest::newRow("game folder is a file") << false;
        QTest::newRow("staging folder is a link") << true;
    }
    void nothingChanges()
    {
        QFETCH(bool, stagingLink);
        if (stagingLink) {
            QVERIFY(QDir().mkpath(m_env->path(u"elsewhere"_s)) && QDir().mkpath(m_games));
            QVERIFY(QFile::link(m_env->path(u"elsewhere"_s), StagingFolderPath(m_games)));
        } else {
            QVERIFY(WriteFile(m_games + u"/Game"_s, "a file, not a game folder"));
        }
        const QString package = packGame(u"Game"_s, 1000);
        QVERIFY(!package.isEmpty());
        const auto before = SnapshotTree(m_env->root());
        const InstallResult result = InstallPackage(package);
        QVERIFY(!result.succeeded());
        if (!stagingLink)
            QVERIFY2(result.problem.contains(u"not a game folder"), qPrintable(result.problem));
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }
};
BV_REGISTER_TEST(TestGameInstaller);
#include "tst_gameinstaller.moc"
