#include "ServiceCommandLine.h"
#include "StagingArea.h"

#include "store/DataFolders.h"
#include "store/InfoFiles.h"

#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QProcess>

#include <list>

using namespace Brimvault;
using namespace Qt::StringLiterals;

// Slot holders (slotholder.cpp) stand for installs that run or were killed.
class TestServiceTidy : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString m_games;
    std::list<QProcess> m_holders;

    // Starts a process that holds an install slot; the slot's folder.
    QString holdSlot(bool holdGamesLock = false)
    {
        QProcess& holder = m_holders.emplace_back();
        holder.start(QStringLiteral(SLOT_HOLDER),
            holdGamesLock ? QStringList {m_games, u"games-lock"_s} : QStringList {m_games});
        if (!holder.waitForStarted() || !holder.waitForReadyRead(30000))
            return QString();
        return QString::fromLocal8Bit(holder.readLine()).trimmed();
    }
    void killHolders()
    {
        for (QProcess& holder : m_holders)
            holder.kill(), holder.waitForFinished();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_games = QDir::cleanPath(DataFolders::GamesFolder());
        QVERIFY(WriteFile(m_games + u"/Existing/Existing.exe"_s, "MZ existing"));
    }
    void cleanup()
    {
        killHolders();
        m_holders.clear();
        m_env.reset();
    }

    // At start (-U) and after a launch (-R) alike, silently.
    void tidyRemovesWhatAKilledInstallLeft_data()
    {
        QTest::addColumn<QString>("command");
        QTest::newRow("at start") << u"-U"_s;
        QTest::newRow("after a launch") << u"-R"_s;
    }
    void tidyRemovesWhatAKilledInstallLeft()
    {
        QFETCH(QString, command);
        const auto clean = SnapshotTree(m_games);
        const QString firstSlot = holdSlot();
        // Killed while it held the games folder lock, as during a final rename.
        const QString secondSlot = holdSlot(true);
        QVERIFY(!firstSlot.isEmpty() && !secondSlot.isEmpty() && firstSlot != secondSlot);
        killHolders();
        QVERIFY(QFileInfo::exists(firstSlot + u"/Half/data/part.bin"_s));
        QVERIFY(QFileInfo::exists(m_games + u'/' + StagingNames::GamesLockFile));
        // A slot whose lock file never got written is a leftover too.
        QVERIFY(QFile::remove(secondSlot + StagingNames::LockSuffix));
        QString output;
        QCOMPARE(RunService({command}, &output), 0);
        QCOMPARE(output, QString());
        QCOMPARE(SnapshotTree(m_games), clean);
    }

    void tidyKeepsRunningInstall()
    {
        const QString runningSlot = holdSlot();
        const QString killedSlot = holdSlot();
        QVERIFY(!runningSlot.isEmpty() && !killedSlot.isEmpty());
        // A hidden name is not enough on every system: the stop mark keeps the folder walk out.
        const QString staging = StagingFolderPath(m_games);
        QCOMPARE(QFileInfo(runningSlot).absolutePath(), staging);
        QVERIFY(QFileInfo(staging).fileName().startsWith(u'.') && InfoFiles::IsStopFolder(staging));
        m_holders.back().kill();
        m_holders.back().waitForFinished();
        const auto before = SnapshotTree(runningSlot);
        QCOMPARE(RunService({u"-U"_s}, nullptr), 0);
        QVERIFY(!QFileInfo::exists(killedSlot));
        QCOMPARE(SnapshotTree(runningSlot), before);
        QVERIFY(QFileInfo::exists(runningSlot + StagingNames::LockSuffix));
        // An install that ends normally takes its slot and the staging folder with it.
        QProcess& running = m_holders.front();
        running.closeWriteChannel();
        QVERIFY(running.waitForFinished());
        QCOMPARE(running.exitCode(), 0);
        QVERIFY(!QFileInfo::exists(StagingFolderPath(m_games)));
    }

    // Without a games folder, or with a staging folder that is a link elsewhere, nothing is touched.
    void tidyTouchesNothingElse_data()
    {
        QTest::addColumn<bool>("stagingLink");
        QTest::newRow("no games folder") << false;
        QTest::newRow("staging folder is a link") << true;
    }
    void tidyTouchesNothingElse()
    {
        QFETCH(bool, stagingLink);
        if (stagingLink) {
            QVERIFY(WriteFile(m_env->path(u"elsewhere/install-1-a/keep.txt"_s), "not ours"));
            QVERIFY(QFile::link(m_env->path(u"elsewhere"_s), StagingFolderPath(m_games)));
        } else {
            QVERIFY(QDir(m_games).removeRecursively());
        }
        const auto before = SnapshotTree(m_env->root());
        for (const QString& command : {u"-U"_s, u"-R"_s, u"/u"_s}) {
            QString output;
            QCOMPARE(RunService({command}, &output), 0);
            QCOMPARE(output, QString());
        }
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }

    void commandLine_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<ServiceCommand::Kind>("kind");
        QTest::addColumn<QString>("package");
        using Kind = ServiceCommand::Kind;
        QTest::newRow("install") << QStringList {u"-I"_s, u"/tmp/a b.bvxpak"_s} << Kind::Install
                                 << u"/tmp/a b.bvxpak"_s;
        QTest::newRow("install lower case") << QStringList {u"-i"_s, u"x.bvxpak"_s} << Kind::Install << u"x.bvxpak"_s;
        QTest::newRow("install slash") << QStringList {u"/I"_s, u"x.bvxpak"_s} << Kind::Install << u"x.bvxpak"_s;
        QTest::newRow("install quoted twice")
            << QStringList {u"-I"_s, u"\"x y.bvxpak\""_s} << Kind::Install << u"x y.bvxpak"_s;
        QTest::newRow("install in pieces")
            << QStringList {u"-I"_s, u"My"_s, u"Game.bvxpak"_s} << Kind::Install << u"My Game.bvxpak"_s;
        QTest::newRow("install without package") << QStringList {u"-I"_s} << Kind::Usage << QString();
        QTest::newRow("install empty") << QStringList {u"-I"_s, u"\"\""_s} << Kind::Usage << QString();
        QTest::newRow("tidy") << QStringList {u"-U"_s} << Kind::Tidy << QString();
        QTest::newRow("tidy with extra") << QStringList {u"-U"_s, u"now"_s} << Kind::Usage << QString();
        QTest::newRow("after launch") << QStringList {u"-r"_s} << Kind::AfterLaunch << QString();
        QTest::newRow("pack") << QStringList {u"--pack"_s, u"dir"_s, u"o.bvxpak"_s} << Kind::Pack << u"o.bvxpak"_s;
        QTest::newRow("pack without output") << QStringList {u"--pack"_s, u"dir"_s} << Kind::Usage << QString();
        QTest::newRow("long unknown") << QStringList {u"-Install"_s, u"x"_s} << Kind::Usage << QString();
    }
    void commandLine()
    {
        QFETCH(QStringList, arguments);
        const ServiceCommand command = ParseServiceCommandLine(arguments);
        QTEST(command.kind, "kind");
        QTEST(command.package, "package");
    }
};
BV_REGISTER_TEST(TestServiceTidy);
#include "tst_servicetidy.moc"
