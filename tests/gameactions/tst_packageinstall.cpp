#include "gameactions/PackageInstallCommand.h"

#include "LaunchRecords.h"
#include "TestEnvironment.h"
#include "support/UserPrompt.h"

#include <QTest>

using namespace Brimvault;

class tst_PackageInstall : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();
    void serviceRunsToItsEnd_data();
    void serviceRunsToItsEnd();
    void withoutServiceShowsError();
    void dialogFolderFollowsLastPackage();
    void dialogTexts();

private:
    QString root(const QString& relative) const { return m_env->path(relative); }
    QString records() const { return root(QStringLiteral("records")); }

    std::unique_ptr<TestEnvironment> m_env;
    QList<PromptRequest> m_prompts;
};

void tst_PackageInstall::init()
{
    m_env = std::make_unique<TestEnvironment>();
    m_prompts.clear();
    SetPromptHandler([this](const PromptRequest& request) {
        m_prompts.append(request);
        return PromptAnswer::Ok;
    });
    QDir().mkpath(records());
    qputenv("BV_LAUNCH_RECORD", records().toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_DIR", root(QStringLiteral("program")).toLocal8Bit());
}

void tst_PackageInstall::cleanup()
{
    SetPromptHandler({});
    qunsetenv("BV_LAUNCH_EXIT");
    qunsetenv("BV_LAUNCH_RECORD");
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
    m_env.reset();
}

void tst_PackageInstall::serviceRunsToItsEnd_data()
{
    QTest::addColumn<QByteArray>("exitCode");
    QTest::addColumn<QString>("package"); // below the test's folder
    QTest::newRow("exit 0") << QByteArray("0") << QStringLiteral("downloads/Lines.bvxpak");
    // Success only means the service ended: its exit code is not read.
    QTest::newRow("exit 1") << QByteArray("1") << QStringLiteral("downloads/Lines.bvxpak");
    QTest::newRow("exit 42") << QByteArray("42") << QStringLiteral("downloads/Lines.bvxpak");
    QTest::newRow("blanks in path") << QByteArray("0") << QStringLiteral("My Downloads/Space Rocks 2.bvxpak");
    QTest::newRow("quote in path") << QByteArray("0") << QStringLiteral("odd/say \"hi\".bvxpak");
}

void tst_PackageInstall::serviceRunsToItsEnd()
{
    QFETCH(QByteArray, exitCode);
    QFETCH(QString, package);
    QVERIFY(InstallRecorder(QStringLiteral(LAUNCH_RECORDER), root(QStringLiteral("program/BrimvaultService"))));
    qputenv("BV_LAUNCH_EXIT", exitCode);
    const QString packagePath = root(package);

    QVERIFY(InstallGamePackage(packagePath));
    QVERIFY(m_prompts.isEmpty());
    // The wait is over only when the service has ended, so its record is there at once.
    const QList<LaunchRecord> calls = ReadLaunchRecords(records(), QStringLiteral("BrimvaultService"));
    QCOMPARE(calls.size(), 1);
    QCOMPARE(calls.first().arguments, (QStringList {QStringLiteral("-I"), packagePath}));
}

void tst_PackageInstall::withoutServiceShowsError()
{
    QVERIFY(!InstallGamePackage(root(QStringLiteral("downloads/Lines.bvxpak"))));
    QCOMPARE(m_prompts.size(), 1);
    QCOMPARE(m_prompts.first().text, QStringLiteral("There was an error! The game isn't installed!"));
    QCOMPARE(m_prompts.first().title, QStringLiteral("Brimvault"));
    QCOMPARE(m_prompts.first().icon, PromptIcon::Critical);
    QCOMPARE(m_prompts.first().buttons, PromptButtons::Ok);
}

void tst_PackageInstall::dialogFolderFollowsLastPackage()
{
    InstallFolderMemory memory;
    QCOMPARE(memory.dialogFolder(), root(QStringLiteral("personal")));
    memory.packageChosen(root(QStringLiteral("downloads/games/Lines.bvxpak")));
    QCOMPARE(memory.dialogFolder(), root(QStringLiteral("downloads/games/")));
}

void tst_PackageInstall::dialogTexts()
{
    QCOMPARE(InstallDialogTitle(), QStringLiteral("Install game"));
    QCOMPARE(InstallDialogFilter(), QStringLiteral("BVXPAK files (*.bvxpak)|*.bvxpak"));
    QCOMPARE(InstallCommandLine(QStringLiteral("/home/u/a b.bvxpak")),
        QStringLiteral("BrimvaultService.exe -I \"/home/u/a b.bvxpak\""));
}

QTEST_GUILESS_MAIN(tst_PackageInstall)
#include "tst_packageinstall.moc"
