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
#include <QPointer>
#include <QtTest>

#include <sys/stat.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

const QStringList Prefixes {u"Quillet"_s, u"Tamarisk"_s, u"Velloran"_s, u"Ostrane"_s, u"Corvelle"_s};

QString savedVersion(const QString& prefix)
{
    return GetSetting(AppTitle(), u"Settings"_s, prefix + u"Version"_s, u"-"_s);
}

int visibleMainWindows()
{
    const QWidgetList windows = QApplication::topLevelWidgets();
    return int(std::count_if(windows.cbegin(), windows.cend(),
        [](const QWidget* w) { return qobject_cast<const frmMain*>(w) && w->isVisible(); }));
}

// Puts the built components in the test's program folder, the stand-in `kind` (built under its file name) for
// `prefix`.
bool addComponents(TestEnvironment& env, const QString& prefix = {}, const QString& kind = {})
{
    const QString folder = env.programDir() + u'/';
    for (const QString& each : Prefixes) {
        const QString file = CompanionComponentFile(each);
        const QString built = each.compare(prefix, Qt::CaseInsensitive) || kind.isEmpty()
            ? QString(QStringLiteral(BRIMVAULT_BIN_DIR "/") + file)
            : QStringLiteral(BRIMVAULT_FIXTURE_DIR "/") + kind + u'/' + file;
        if (!QFile::copy(built, folder + file))
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
    // A window takes its menus with it: each top-level widget is deleted once, if it is still there.
    void cleanup()
    {
        QList<QPointer<QWidget>> windows;
        for (QWidget* widget : QApplication::topLevelWidgets())
            windows << widget;
        for (const QPointer<QWidget>& window : windows)
            delete window.data();
    }

    void firstRunRegistersAllAndShowsWindow()
    {
        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addComponents(env));
        modMain::Main();
        for (const QString& prefix : Prefixes) {
            QCOMPARE(savedVersion(prefix), QStringLiteral(BRIMVAULT_VERSION));
            QCOMPARE(
                RegisteredLibrary(prefix + u".clsVersion"_s), env.programDir() + u'/' + CompanionComponentFile(prefix));
        }
        QCOMPARE(GetAllSettings(AppTitle(), u"Settings"_s).size(), 5);
        QVERIFY(prompts.prompts.isEmpty());
        QCOMPARE(visibleMainWindows(), 1);
        modMain::Main();
        QCOMPARE(visibleMainWindows(), 1);
    }

    void failingComponentStopsStartup_data()
    {
        QTest::addColumn<QString>("velloran");
        for (const char* kind : {"RegisterFails", "RegistersNothing", "NoGetVersion"})
            QTest::newRow(kind) << QString::fromLatin1(kind);
    }
    void failingComponentStopsStartup()
    {
        QFETCH(QString, velloran);
        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addComponents(env, u"Velloran"_s, velloran));
        modMain::Main();
        QCOMPARE(prompts.texts(), QStringList {u"You need to run the program as administrator!"_s});
        QCOMPARE(visibleMainWindows(), 0);
        const QString v = QStringLiteral(BRIMVAULT_VERSION);
        const QStringList versions {v, v, u"-"_s, u"-"_s, u"-"_s};
        for (qsizetype i = 0; i < Prefixes.size(); ++i)
            QCOMPARE(savedVersion(Prefixes[i]), versions[i]);
        // The components after the failing one were never registered, let alone loaded.
        QVERIFY(RegisteredLibrary(u"Ostrane.clsVersion"_s).isEmpty());
        QVERIFY(RegisteredLibrary(u"Corvelle.clsVersion"_s).isEmpty());
    }

    void versionComparison_data()
    {
        QTest::addColumn<QString>("saved"); // a null text: no value saved
        QTest::addColumn<QString>("installed");
        QTest::addColumn<bool>("written");
        QTest::newRow("unchanged") << u"1.0.0"_s << u"1.0.0"_s << false;
        QTest::newRow("differs only in case") << u"2.0.0-beta"_s << u"2.0.0-Beta"_s << true;
        QTest::newRow("saved is newer") << u"9.9.9"_s << u"1.0.0"_s << true;
        QTest::newRow("trailing space") << u"1.0.0 "_s << u"1.0.0"_s << true;
        QTest::newRow("never saved") << QString() << u"1.0.0"_s << true;
        QTest::newRow("empty version, never saved") << QString() << QString() << false;
    }
    void versionComparison()
    {
        QFETCH(QString, saved);
        QFETCH(QString, installed);
        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addComponents(env, u"Quillet"_s, u"EnvVersion"_s));
        qputenv("BRIMVAULT_FIXTURE_VERSION", installed.toUtf8());
        auto restoreVersion = qScopeGuard([] { qunsetenv("BRIMVAULT_FIXTURE_VERSION"); });
        // The first run registers everything, so that the checks find every object at the first attempt.
        modMain::Main();
        QCOMPARE(visibleMainWindows(), 1);
        if (saved.isNull())
            DeleteSetting(AppTitle(), u"Settings"_s, u"QuilletVersion"_s);
        else
            QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, u"QuilletVersion"_s, saved));
        const QByteArray settingsBefore = stampOf(env.settingsFile());
        const QByteArray registryBefore = stampOf(ComponentRegistryPath());

        // The checks alone: localisation, which Main runs next, keeps its own settings.
        for (const QString& prefix : Prefixes)
            QVERIFY2(modMain::CheckComponent(prefix), qPrintable(prefix));

        QVERIFY(prompts.prompts.isEmpty());
        QCOMPARE(savedVersion(u"Quillet"_s), installed.isNull() ? u"-"_s : installed);
        QTEST(stampOf(env.settingsFile()) != settingsBefore, "written");
        QCOMPARE(stampOf(ComponentRegistryPath()), registryBefore);
    }

    void registerComponent_data()
    {
        QTest::addColumn<QString>("prefix");
        QTest::addColumn<QString>("kind"); // the stand-in in the program folder for Velloran
        QTest::addColumn<int>("status");
        QTest::addColumn<bool>("registered");
        QTest::newRow("real component") << u"Quillet"_s << QString() << 0 << true;
        QTest::newRow("prefix matched without case") << u"oSTRANE"_s << QString() << 0 << true;
        QTest::newRow("refusing component") << u"Velloran"_s << u"RegisterFails"_s << int(0x80070005) << false;
        QTest::newRow("unknown prefix does nothing") << u"Nobody"_s << QString() << 0 << false;
    }
    void registerComponent()
    {
        QFETCH(QString, prefix);
        QFETCH(QString, kind);
        QFETCH(bool, registered);
        TestEnvironment env;
        QVERIFY(addComponents(env, u"Velloran"_s, kind));
        QTEST(modMain::RegisterComponent(prefix), "status");
        QCOMPARE(RegisteredLibrary(prefix + u".clsVersion"_s),
            registered ? env.programDir() + u'/' + CompanionComponentFile(prefix) : QString());
        QCOMPARE(QFileInfo::exists(ComponentRegistryPath()), registered);
    }

    // Without a program folder named, the program finds its components beside itself.
    void realProgramFindsItsComponents()
    {
        TestEnvironment env;
        ProgramRunOptions options;
        options.unsetEnvironment = QStringList {u"BRIMVAULT_PROGRAM_DIR"_s};
        const ProgramOutcome outcome = RunProgram(env, QString(), options);
        QVERIFY2(outcome.showedWindow(), qPrintable(outcome.describe()));
        for (const QString& prefix : Prefixes)
            QCOMPARE(savedVersion(prefix), QStringLiteral(BRIMVAULT_VERSION));
    }
};

BV_REGISTER_TEST(TestStartup);
#include "tst_startup.moc"
