// Installing a game from outside while the window runs: the real service packs and installs, the window
// notices through the settings signal and lists the new game.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "i18n/modLocalizer.h"
#include "store/CatalogueKeys.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QLabel>
#include <QProcess>
#include <QSignalSpy>
#include <QTest>

#include <memory>

using namespace Brimvault;

namespace {

struct Run {
    bool finished = false;
    int exitCode = -1;
    QString output;
};

Run runService(const QStringList& arguments)
{
    QProcess process;
    process.setProcessChannelMode(QProcess::MergedChannels);
    process.start(QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService"), arguments);
    Run run;
    run.finished = process.waitForFinished(60000) && process.exitStatus() == QProcess::NormalExit;
    run.exitCode = process.exitCode();
    run.output = QString::fromLocal8Bit(process.readAll());
    return run;
}

QStringList captionsOf(SimpleListView* list)
{
    QStringList captions;
    for (int i = 0; i < list->layoutState().itemCount; ++i)
        captions << list->labN(i).text();
    return captions;
}

QStringList treeOf(const QString& root)
{
    QStringList entries;
    QDirIterator it(
        root, QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot, QDirIterator::Subdirectories);
    while (it.hasNext())
        entries << QDir(root).relativeFilePath(it.next());
    entries.sort();
    return entries;
}

QString newGameSignal()
{
    return GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey,
        CatalogueKeys::NoNewGameInstalled);
}

} // namespace

class TestInstallEndToEnd : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;
    std::unique_ptr<frmMain> m_window;
    QString m_games;

    void openWindow()
    {
        m_window = std::make_unique<frmMain>();
        QSignalSpy rebuilt(m_window.get(), &frmMain::listRebuilt);
        m_window->show();
        QVERIFY(rebuilt.wait(10000));
        QVERIFY(QTest::qWaitForWindowExposed(m_window.get()));
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(false);
        QVERIFY(RegisterQuillet());
        modLocalizer::UseBuiltInLanguage();
        SetPromptHandler([](const PromptRequest&) { return PromptAnswer::Ok; });
        m_games = QDir::cleanPath(DataFolders::GamesFolder());
        QVERIFY(QDir().mkpath(m_games));
    }

    void cleanup()
    {
        m_window.reset();
        SetPromptHandler({});
        m_program.reset();
        m_env.reset();
    }

    void installedGameAppearsInTheRunningWindow()
    {
        openWindow();
        SimpleListView* list = m_window->ListView1();
        const QStringList before = captionsOf(list);
        QVERIFY(!before.contains(QStringLiteral("Star Quest Deluxe")));

        const QString source = m_env->path(QStringLiteral("sources/Star Quest"));
        QVERIFY(QDir().mkpath(source));
        const QString exe = source + QStringLiteral("/StarQuest.exe");
        QVERIFY(QFile::copy(QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe/multi32.exe"), exe));
        // The name differs from both the folder and the file, so the caption can only come from the info file.
        QVERIFY(WriteGameInfo(exe, QStringLiteral("Star Quest Deluxe"), QStringLiteral("Star Quest Deluxe")));
        QVERIFY(QFile::exists(source + QStringLiteral("/StarQuest.bvxinf")));

        const QString package = m_env->path(QStringLiteral("StarQuest.bvxpak"));
        const Run packed = runService({QStringLiteral("--pack"), source, package});
        QVERIFY2(packed.finished && packed.exitCode == 0, qPrintable(packed.output));
        QVERIFY(QFile::exists(package));

        const Run installed = runService({QStringLiteral("-I"), package});
        QVERIFY2(installed.finished && installed.exitCode == 0, qPrintable(installed.output));
        QVERIFY(QFile::exists(m_games + QStringLiteral("/Star Quest/StarQuest.exe")));

        QTRY_VERIFY_WITH_TIMEOUT(captionsOf(list).contains(QStringLiteral("Star Quest Deluxe")), 8000);
        QCOMPARE(captionsOf(list).size(), before.size() + 1);
        QTRY_COMPARE_WITH_TIMEOUT(newGameSignal(), QStringLiteral("0"), 8000);
    }

    void maliciousPackageIsRefused()
    {
        openWindow();
        SimpleListView* list = m_window->ListView1();
        const QStringList before = captionsOf(list);
        const QStringList gamesBefore = treeOf(m_games);
        const QString outside = QFileInfo(m_games).absolutePath() + QStringLiteral("/evil.exe");

        const QString package = m_env->path(QStringLiteral("evil.bvxpak"));
        QProcess python;
        python.start(QStringLiteral("python3"),
            {QStringLiteral("-c"),
                QStringLiteral("import sys, zipfile\n"
                               "with zipfile.ZipFile(sys.argv[1], 'w') as z:\n"
                               "    z.writestr('Evil/Evil.exe', b'MZ evil')\n"
                               "    z.writestr('Evil/../../evil.exe', b'MZ escaped')\n"),
                package});
        QVERIFY(python.waitForFinished(30000));
        QCOMPARE(python.exitCode(), 0);

        const Run installed = runService({QStringLiteral("-I"), package});
        QVERIFY(installed.finished);
        QVERIFY2(installed.exitCode != 0, qPrintable(installed.output));
        QVERIFY2(installed.output.contains(QStringLiteral("outside its folder")), qPrintable(installed.output));

        // Longer than the window's poll, so that a wrongly raised signal would have shown by now.
        QTest::qWait(4000);
        QCOMPARE(newGameSignal(), QStringLiteral("0"));
        QCOMPARE(captionsOf(list), before);
        QCOMPARE(treeOf(m_games), gamesBefore);
        QVERIFY(!QFile::exists(outside));
    }
};

QTEST_MAIN(TestInstallEndToEnd)
#include "tst_installendtoend.moc"
