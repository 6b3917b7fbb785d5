// Start-up in process: the five components checked in order, registered when needed, their versions stored.
#include "ProgramRun.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include "app/CompanionComponents.h"
#include "app/ComponentRegistry.h"
#include "app/startup/modMain.h"
#include "store/SettingsStore.h"
#include "ui/main/frmMain.h"

#include <QApplication>
#include <QtTest>

#include <sys/stat.h>

using namespace Brimvault;

namespace {

const QStringList prefixes {QStringLiteral("Quillet"), QStringLiteral("Tamarisk"), QStringLiteral("Velloran"),
    QStringLiteral("Ostrane"), QStringLiteral("Corvelle")};

QString savedVersion(const QString& prefix)
{
    return GetSetting(AppTitle(), QStringLiteral("Settings"), prefix + QStringLiteral("Version"), QStringLiteral("-"));
}

int visibleMainWindows()
{
    const QWidgetList windows = QApplication::topLevelWidgets();
    return int(std::count_if(windows.cbegin(), windows.cend(),
        [](const QWidget* w) { return qobject_cast<const frmMain*>(w) && w->isVisible(); }));
}

// Puts the built component, a stand-in built under its file name, or "garbage" in the test's program folder.
bool addComponent(TestEnvironment& env, const QString& prefix, const QString& kind = {})
{
    const QString file = CompanionComponentFile(prefix);
    const QString target = env.programDir() + u'/' + file;
    if (kind == QStringLiteral("garbage"))
        return WriteFile(target, "MZ this is not a library");
    const QString source = kind.isEmpty() ? QString(QStringLiteral(BRIMVAULT_BIN_DIR "/") + file)
                                          : QStringLiteral(BRIMVAULT_FIXTURE_DIR "/") + kind + u'/' + file;
    return QFile::copy(source, target);
}

bool addAllComponentsBut(TestEnvironment& env, const QString& skipped)
{
    for (const QString& prefix : prefixes) {
        if (prefix != skipped && !addComponent(env, prefix))
            return false;
    }
    return true;
}

// Whether a file was written: its bytes, its inode (writers replace the file) and its time stamp.
QByteArray stampOf(const QString& path)
{
    struct stat st { };
    ::stat(QFile::encodeName(path).constData(), &st);
    return ReadFile(path) + QByteArray::number(qint64(st.st_ino)) + ':' + QByteArray::number(qint64(st.st_mtim.tv_sec))
        + '.' + QByteArray::number(qint64(st.st_mtim.tv_nsec));
}

} // namespace

class TestStartup : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void cleanup() { qDeleteAll(QApplication::topLevelWidgets()); }

    void firstRunRegistersAllAndShowsWindow()
    {
        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addAllComponentsBut(env, QString()));

        modMain::Main();

        for (const QString& prefix : prefixes) {
            QCOMPARE(savedVersion(prefix), QStringLiteral(BRIMVAULT_VERSION));
            QCOMPARE(RegisteredLibrary(prefix + QStringLiteral(".clsVersion")),
                QDir(env.programDir()).filePath(CompanionComponentFile(prefix)));
        }
        QCOMPARE(GetAllSettings(AppTitle(), QStringLiteral("Settings")).size(), 5);
        QVERIFY(prompts.prompts.isEmpty());
        QCOMPARE(visibleMainWindows(), 1);
        // A second call finds the window there and does not make another.
        modMain::Main();
        QCOMPARE(visibleMainWindows(), 1);
    }

    void failingComponentStopsStartup_data()
    {
        QTest::addColumn<QString>("velloran");
        QTest::newRow("file missing") << QString();
        for (const char* kind : {"RegisterFails", "RegistersNothing", "NoGetVersion", "NoEntryPoint", "garbage"})
            QTest::newRow(kind) << QString::fromLatin1(kind);
    }

    void failingComponentStopsStartup()
    {
        QFETCH(QString, velloran);
        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addAllComponentsBut(env, QStringLiteral("Velloran")));
        if (!velloran.isEmpty())
            QVERIFY(addComponent(env, QStringLiteral("Velloran"), velloran));

        modMain::Main();

        QCOMPARE(prompts.prompts.size(), 1);
        const PromptRequest& message = prompts.prompts.first();
        QCOMPARE(message.text, QStringLiteral("You need to run the program as administrator!"));
        QCOMPARE(message.title, QStringLiteral("Brimvault"));
        QCOMPARE(message.icon, PromptIcon::Critical);
        QCOMPARE(message.buttons, PromptButtons::Ok);
        QCOMPARE(visibleMainWindows(), 0);
        QCOMPARE(savedVersion(QStringLiteral("Quillet")), QStringLiteral(BRIMVAULT_VERSION));
        QCOMPARE(savedVersion(QStringLiteral("Tamarisk")), QStringLiteral(BRIMVAULT_VERSION));
        for (const QString& untouched : prefixes.mid(2))
            QCOMPARE(savedVersion(untouched), QStringLiteral("-"));
        // The components after the failing one were never registered, let alone loaded.
        QVERIFY(RegisteredLibrary(QStringLiteral("Ostrane.clsVersion")).isEmpty());
        QVERIFY(RegisteredLibrary(QStringLiteral("Corvelle.clsVersion")).isEmpty());
    }

    void versionComparison_data()
    {
        QTest::addColumn<QString>("saved"); // a null text: no value saved
        QTest::addColumn<QString>("installed");
        QTest::addColumn<bool>("written");

        QTest::newRow("unchanged") << QStringLiteral("1.0.0") << QStringLiteral("1.0.0") << false;
        QTest::newRow("differs only in case") << QStringLiteral("2.0.0-beta") << QStringLiteral("2.0.0-Beta") << true;
        QTest::newRow("saved is newer") << QStringLiteral("9.9.9") << QStringLiteral("1.0.0") << true;
        QTest::newRow("trailing space") << QStringLiteral("1.0.0 ") << QStringLiteral("1.0.0") << true;
        QTest::newRow("never saved") << QString() << QStringLiteral("1.0.0") << true;
        QTest::newRow("empty version, never saved") << QString() << QString() << false;
    }

    void versionComparison()
    {
        QFETCH(QString, saved);
        QFETCH(QString, installed);
        QFETCH(bool, written);

        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addAllComponentsBut(env, QStringLiteral("Quillet")));
        QVERIFY(addComponent(env, QStringLiteral("Quillet"), QStringLiteral("EnvVersion")));
        qputenv("BRIMVAULT_FIXTURE_VERSION", installed.toUtf8());
        auto restoreVersion = qScopeGuard([] { qunsetenv("BRIMVAULT_FIXTURE_VERSION"); });
        // The first run registers everything, so that the second finds every object at the first attempt.
        modMain::Main();
        QCOMPARE(visibleMainWindows(), 1);
        if (saved.isNull())
            DeleteSetting(AppTitle(), QStringLiteral("Settings"), QStringLiteral("QuilletVersion"));
        else
            QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Settings"), QStringLiteral("QuilletVersion"), saved));
        const QByteArray settingsBefore = stampOf(env.settingsFile());
        const QByteArray registryBefore = stampOf(ComponentRegistryPath());

        // The checks alone: localisation, which Main runs next, keeps its own settings.
        for (const QString& prefix : prefixes)
            QVERIFY2(modMain::CheckComponent(prefix), qPrintable(prefix));

        QVERIFY(prompts.prompts.isEmpty());
        QCOMPARE(savedVersion(QStringLiteral("Quillet")), installed.isNull() ? QStringLiteral("-") : installed);
        QCOMPARE(stampOf(env.settingsFile()) != settingsBefore, written);
        QCOMPARE(stampOf(ComponentRegistryPath()), registryBefore);
    }

    void registerComponent_data()
    {
        QTest::addColumn<QString>("prefix");
        QTest::addColumn<QString>("kind"); // what lies in the program folder for it; "none": nothing
        QTest::addColumn<int>("status"); // -1: raises ComponentFileError
        QTest::addColumn<bool>("registered");

        QTest::newRow("real component") << QStringLiteral("Quillet") << QString() << 0 << true;
        QTest::newRow("prefix matched without case") << QStringLiteral("oSTRANE") << QString() << 0 << true;
        QTest::newRow("refusing component")
            << QStringLiteral("Velloran") << QStringLiteral("RegisterFails") << int(0x80070005) << false;
        QTest::newRow("unknown prefix does nothing")
            << QStringLiteral("Nobody") << QStringLiteral("none") << 0 << false;
        QTest::newRow("file missing") << QStringLiteral("Velloran") << QStringLiteral("none") << -1 << false;
        QTest::newRow("no DllRegisterServer")
            << QStringLiteral("Velloran") << QStringLiteral("NoEntryPoint") << -1 << false;
    }

    void registerComponent()
    {
        QFETCH(QString, prefix);
        QFETCH(QString, kind);
        QFETCH(int, status);
        QFETCH(bool, registered);

        TestEnvironment env;
        const QString folder = env.programDir();
        if (kind != QStringLiteral("none"))
            QVERIFY(addComponent(env, QFileInfo(CompanionComponentFile(prefix)).completeBaseName(), kind));

        if (status == -1) {
            QVERIFY_THROWS_EXCEPTION(modMain::ComponentFileError, modMain::RegisterComponent(prefix));
        } else {
            QCOMPARE(modMain::RegisterComponent(prefix), status);
        }
        const QString library = RegisteredLibrary(prefix + QStringLiteral(".clsVersion"));
        QCOMPARE(library, registered ? QDir(folder).filePath(CompanionComponentFile(prefix)) : QString());
        if (prefix == QStringLiteral("Nobody"))
            QVERIFY(!QFileInfo::exists(ComponentRegistryPath()));
    }

    // Without a program folder named, the program finds its components beside itself.
    void realProgramFindsItsComponents()
    {
        TestEnvironment env;
        ProgramRunOptions options;
        options.unsetEnvironment = QStringList {QStringLiteral("BRIMVAULT_PROGRAM_DIR")};

        const ProgramOutcome outcome = RunProgram(env, QString(), options);

        QVERIFY2(outcome.showedWindow(), qPrintable(outcome.describe()));
        for (const QString& prefix : prefixes)
            QCOMPARE(savedVersion(prefix), QStringLiteral(BRIMVAULT_VERSION));
    }
};

BV_REGISTER_TEST(TestStartup);
#include "tst_startup.moc"
