#include "ServiceCommandLine.h"
#include "StagingArea.h"

#include "store/DataFolders.h"
#include "store/InfoFiles.h"

#include "ServiceTestSupport.h"
#include "TestEnvironment.h"

#include <QProcess>
#include <QtTest>

#include <memory>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using namespace ServiceTestSupport;

class TestServiceTidy : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void init();
    void cleanup();
    void stagingIsHiddenFromDiscovery();
    void tidyRemovesWhatAKilledInstallLeft_data();
    void tidyRemovesWhatAKilledInstallLeft();
    void tidyKeepsRunningInstall();
    void tidyWithoutGamesFolder();
    void tidyDoesNotFollowStagingLink();
    void commandLine_data();
    void commandLine();

private:
    // Starts a process that holds an install slot; returns the slot's folder.
    QString holdSlot(QProcess& holder, bool holdGamesLock = false);
    void kill(QProcess& holder);

    std::unique_ptr<TestEnvironment> m_environment;
    QString m_games;
};

void TestServiceTidy::init()
{
    m_environment = std::make_unique<TestEnvironment>();
    m_games = QDir::cleanPath(DataFolders::GamesFolder());
    QVERIFY(writeFile(m_games + u"/Existing/Existing.exe"_s, "MZ existing"));
}

void TestServiceTidy::cleanup()
{
    m_environment.reset();
}

QString TestServiceTidy::holdSlot(QProcess& holder, bool holdGamesLock)
{
    QStringList arguments {m_games};
    if (holdGamesLock)
        arguments.append(u"games-lock"_s);
    holder.start(QStringLiteral(SLOT_HOLDER), arguments);
    if (!holder.waitForStarted() || !holder.waitForReadyRead(30000))
        return QString();
    return QString::fromLocal8Bit(holder.readLine()).trimmed();
}

void TestServiceTidy::kill(QProcess& holder)
{
    holder.kill();
    holder.waitForFinished();
}

void TestServiceTidy::stagingIsHiddenFromDiscovery()
{
    QProcess holder;
    const QString slot = holdSlot(holder);
    QVERIFY(QFileInfo(slot).isDir());
    const QString staging = StagingFolderPath(m_games);
    QCOMPARE(QFileInfo(slot).absolutePath(), staging);
    // A hidden name is not enough on every system: the stop mark keeps the folder walk out.
    QVERIFY(QFileInfo(staging).fileName().startsWith(u'.'));
    QVERIFY(InfoFiles::IsStopFolder(staging));
    kill(holder);
}

void TestServiceTidy::tidyRemovesWhatAKilledInstallLeft_data()
{
    QTest::addColumn<QString>("command");
    QTest::newRow("at start") << u"-U"_s;
    QTest::newRow("after a launch") << u"-R"_s;
}

void TestServiceTidy::tidyRemovesWhatAKilledInstallLeft()
{
    QFETCH(QString, command);
    const QStringList clean = treeListing(m_games);

    QProcess first;
    QProcess second;
    const QString firstSlot = holdSlot(first);
    // Killed while it held the games folder lock, as during a final rename.
    const QString secondSlot = holdSlot(second, true);
    QVERIFY(!firstSlot.isEmpty() && !secondSlot.isEmpty());
    QVERIFY(firstSlot != secondSlot);
    kill(first);
    kill(second);
    QVERIFY(QFileInfo::exists(firstSlot + u"/Half/data/part.bin"_s));
    QVERIFY(QFileInfo::exists(m_games + u'/' + StagingNames::GamesLockFile));
    // A slot whose lock file never got written is a leftover too.
    QVERIFY(QFile::remove(secondSlot + StagingNames::LockSuffix));

    const ServiceRun run = runService({command});
    QVERIFY(run.finished);
    QCOMPARE(run.exitCode, 0);
    QCOMPARE(run.standardOutput, QString());
    QCOMPARE(run.standardError, QString());
    QCOMPARE(treeListing(m_games), clean);
}

void TestServiceTidy::tidyKeepsRunningInstall()
{
    QProcess running;
    QProcess killed;
    const QString runningSlot = holdSlot(running);
    const QString killedSlot = holdSlot(killed);
    QVERIFY(!runningSlot.isEmpty() && !killedSlot.isEmpty());
    kill(killed);

    const QStringList before = treeListing(runningSlot);
    QCOMPARE(runService({u"-U"_s}).exitCode, 0);
    QVERIFY(!QFileInfo::exists(killedSlot));
    QCOMPARE(treeListing(runningSlot), before);
    QVERIFY(QFileInfo::exists(runningSlot + StagingNames::LockSuffix));

    // An install that ends normally takes its slot and the staging folder with it.
    running.closeWriteChannel();
    QVERIFY(running.waitForFinished());
    QCOMPARE(running.exitCode(), 0);
    QVERIFY(!QFileInfo::exists(StagingFolderPath(m_games)));
}

void TestServiceTidy::tidyWithoutGamesFolder()
{
    QVERIFY(QDir(m_games).removeRecursively());
    const QStringList before = treeListing(m_environment->root());
    for (const QString& command : {u"-U"_s, u"-R"_s, u"/u"_s}) {
        const ServiceRun run = runService({command});
        QCOMPARE(run.exitCode, 0);
        QCOMPARE(run.standardError, QString());
    }
    QCOMPARE(treeListing(m_environment->root()), before);
}

void TestServiceTidy::tidyDoesNotFollowStagingLink()
{
    const QString elsewhere = m_environment->path(u"elsewhere"_s);
    QVERIFY(writeFile(elsewhere + u"/install-1-a/keep.txt"_s, "not ours"));
    QVERIFY(QFile::link(elsewhere, StagingFolderPath(m_games)));
    const QStringList before = treeListing(m_environment->root());
    QCOMPARE(runService({u"-U"_s}).exitCode, 0);
    QCOMPARE(treeListing(m_environment->root()), before);
}

void TestServiceTidy::commandLine_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<int>("kind");
    QTest::addColumn<QString>("package");

    using Kind = ServiceCommand::Kind;
    QTest::newRow("install") << QStringList {u"-I"_s, u"/tmp/a b.bvxpak"_s} << int(Kind::Install)
                             << u"/tmp/a b.bvxpak"_s;
    QTest::newRow("install lower case") << QStringList {u"-i"_s, u"x.bvxpak"_s} << int(Kind::Install) << u"x.bvxpak"_s;
    QTest::newRow("install slash") << QStringList {u"/I"_s, u"x.bvxpak"_s} << int(Kind::Install) << u"x.bvxpak"_s;
    QTest::newRow("install quoted twice")
        << QStringList {u"-I"_s, u"\"x y.bvxpak\""_s} << int(Kind::Install) << u"x y.bvxpak"_s;
    QTest::newRow("install in pieces") << QStringList {u"-I"_s, u"My"_s, u"Game.bvxpak"_s} << int(Kind::Install)
                                       << u"My Game.bvxpak"_s;
    QTest::newRow("install empty") << QStringList {u"-I"_s, u"\"\""_s} << int(Kind::Usage) << QString();
    QTest::newRow("tidy") << QStringList {u"-U"_s} << int(Kind::Tidy) << QString();
    QTest::newRow("after launch") << QStringList {u"-r"_s} << int(Kind::AfterLaunch) << QString();
    QTest::newRow("pack") << QStringList {u"--pack"_s, u"dir"_s, u"o.bvxpak"_s} << int(Kind::Pack) << u"o.bvxpak"_s;
    QTest::newRow("long unknown") << QStringList {u"-Install"_s, u"x"_s} << int(Kind::Usage) << QString();
}

void TestServiceTidy::commandLine()
{
    QFETCH(QStringList, arguments);
    QFETCH(int, kind);
    QFETCH(QString, package);
    const ServiceCommand command = ParseServiceCommandLine(arguments);
    QCOMPARE(int(command.kind), kind);
    QCOMPARE(command.package, package);
}

QTEST_GUILESS_MAIN(TestServiceTidy)
#include "tst_servicetidy.moc"
