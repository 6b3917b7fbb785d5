// Installing a game from outside while the window runs: the real service packs and installs, the window
// notices through the settings signal and lists the new game; a package that reaches outside is refused.
#include "MainWindowFixture.h"
#include "Packages.h"
#include "PeFixtures.h"
#include "ProgramRun.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QLabel>
#include <QSignalSpy>
#include <QTest>

using namespace Brimvault;

class TestInstallEndToEnd : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;
    std::unique_ptr<PromptRecorder> m_prompts;
    std::unique_ptr<frmMain> m_window;

    QStringList captions() const
    {
        QStringList captions;
        for (int i = 0; i < m_window->ListView1()->layoutState().itemCount; ++i)
            captions << m_window->ListView1()->labN(i).text();
        return captions;
    }

    static QString newGameSignal()
    {
        return GetSetting(
            AppTitle(), QStringLiteral("Commands"), QStringLiteral("NewGameInstalled"), QStringLiteral("0"));
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(false);
        m_prompts = std::make_unique<PromptRecorder>();
        QVERIFY(RegisterQuillet());
        modLocalizer::UseBuiltInLanguage();
        QVERIFY(QDir().mkpath(DataFolders::GamesFolder()));
        m_window = std::make_unique<frmMain>();
        QSignalSpy rebuilt(m_window.get(), &frmMain::listRebuilt);
        m_window->show();
        QVERIFY(rebuilt.wait(10000));
    }

    void cleanup()
    {
        m_window.reset();
        m_prompts.reset();
        m_program.reset();
        m_env.reset();
    }

    void installedGameAppearsInTheRunningWindow()
    {
        const QStringList before = captions();
        const QString exe = m_env->path(QStringLiteral("sources/Star Quest/StarQuest.exe"));
        QVERIFY(WriteFile(exe, ReadFile(PeFixture(QStringLiteral("multi32.exe")))));
        // The name differs from both the folder and the file, so the caption can only come from the info file.
        QVERIFY(WriteGameInfo(exe, QStringLiteral("Star Quest Deluxe"), QStringLiteral("Star Quest Deluxe")));
        const QString package = m_env->path(QStringLiteral("StarQuest.bvxpak"));
        QString output;
        QVERIFY2(RunService({QStringLiteral("--pack"), QFileInfo(exe).absolutePath(), package}, &output) == 0,
            qPrintable(output));
        QVERIFY2(RunService({QStringLiteral("-I"), package}, &output) == 0, qPrintable(output));
        QVERIFY(QFile::exists(DataFolders::GamesFolder() + QStringLiteral("Star Quest/StarQuest.exe")));

        QTRY_VERIFY_WITH_TIMEOUT(captions().contains(QStringLiteral("Star Quest Deluxe")), 8000);
        QCOMPARE(captions().size(), before.size() + 1);
        QTRY_COMPARE_WITH_TIMEOUT(newGameSignal(), QStringLiteral("0"), 8000);
    }

    void packageReachingOutsideIsRefused()
    {
        const QStringList before = captions();
        const QMap<QString, QByteArray> gamesBefore = SnapshotTree(DataFolders::GamesFolder());
        const QString package = m_env->path(QStringLiteral("evil.bvxpak"));
        QVERIFY(CraftPackage(QStringLiteral("dotdot"), package));

        QString output;
        const int exitCode = RunService({QStringLiteral("-I"), package}, &output);
        QVERIFY2(exitCode > 0 && output.contains(QStringLiteral("outside its folder")), qPrintable(output));

        // Longer than the window's poll, so that a wrongly raised signal would have shown by now.
        QTest::qWait(4000);
        QCOMPARE(newGameSignal(), QStringLiteral("0"));
        QCOMPARE(captions(), before);
        QCOMPARE(SnapshotTree(DataFolders::GamesFolder()), gamesBefore);
    }
};

QTEST_MAIN(TestInstallEndToEnd)
#include "tst_installendtoend.moc"
