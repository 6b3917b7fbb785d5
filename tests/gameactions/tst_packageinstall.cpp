#include "gameactions/PackageInstallCommand.h"

#include "LaunchRecords.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestPackageInstall : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<PromptRecorder> m_prompts;
    QString root(const QString& relative) const { return m_env->path(relative); }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_prompts = std::make_unique<PromptRecorder>();
        QDir().mkpath(root(u"records"_s));
        qputenv("BV_LAUNCH_RECORD", root(u"records"_s).toLocal8Bit());
        qputenv("BRIMVAULT_PROGRAM_DIR", root(u"program"_s).toLocal8Bit());
    }
    void cleanup()
    {
        qunsetenv("BV_LAUNCH_EXIT");
        m_prompts.reset();
        m_env.reset();
    }

    // Success only means the service ended: its exit code is not read. The wait is over only when the
    // service has ended, so its record is there at once.
    void serviceRunsToItsEnd_data()
    {
        QTest::addColumn<QByteArray>("exitCode");
        QTest::addColumn<QString>("package");
        QTest::newRow("exit 0") << QByteArray("0") << u"downloads/Lines.bvxpak"_s;
        QTest::newRow("exit 42") << QByteArray("42") << u"downloads/Lines.bvxpak"_s;
        QTest::newRow("blanks in path") << QByteArray("0") << u"My Downloads/Space Rocks 2.bvxpak"_s;
        QTest::newRow("quote in path") << QByteArray("0") << u"odd/say \"hi\".bvxpak"_s;
    }
    void serviceRunsToItsEnd()
    {
        QFETCH(QByteArray, exitCode);
        QFETCH(QString, package);
        QVERIFY(InstallRecorder(QStringLiteral(LAUNCH_RECORDER), root(u"program/BrimvaultService"_s)));
        qputenv("BV_LAUNCH_EXIT", exitCode);
        QVERIFY(InstallGamePackage(root(package)));
        QVERIFY(m_prompts->prompts.isEmpty());
        const QList<LaunchRecord> calls = ReadLaunchRecords(root(u"records"_s), u"BrimvaultService"_s);
        QCOMPARE(calls.size(), 1);
        QCOMPARE(calls.first().arguments, (QStringList {u"-I"_s, root(package)}));
    }

    void withoutServiceShowsError()
    {
        QVERIFY(!InstallGamePackage(root(u"downloads/Lines.bvxpak"_s)));
        QCOMPARE(m_prompts->prompts.size(), 1);
        QCOMPARE(m_prompts->prompts.first().text, u"There was an error! The game isn't installed!"_s);
        QCOMPARE(m_prompts->prompts.first().title, u"Brimvault"_s);
        QCOMPARE(m_prompts->prompts.first().icon, PromptIcon::Critical);
        QCOMPARE(m_prompts->prompts.first().buttons, PromptButtons::Ok);
    }

    void dialog()
    {
        InstallFolderMemory memory;
        QCOMPARE(memory.dialogFolder(), root(u"personal"_s));
        memory.packageChosen(root(u"downloads/games/Lines.bvxpak"_s));
        QCOMPARE(memory.dialogFolder(), root(u"downloads/games/"_s));
        QCOMPARE(InstallDialogTitle(), u"Install game"_s);
        QCOMPARE(InstallDialogFilter(), u"BVXPAK files (*.bvxpak)|*.bvxpak"_s);
        QCOMPARE(InstallCommandLine(u"/home/u/a b.bvxpak"_s), u"BrimvaultService.exe -I \"/home/u/a b.bvxpak\""_s);
    }
};
BV_REGISTER_TEST(TestPackageInstall);
#include "tst_packageinstall.moc"
