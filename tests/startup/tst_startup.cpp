// Start-up: the command line, the message and input boxes (as widgets and as the prompt log that lets tests watch
// the real program), and the five components checked in order, registered when needed, their versions stored.
#include "MainWindowFixture.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "app/CompanionComponents.h"
#include "app/ComponentRegistry.h"
#include "app/startup/CommandLine.h"
#include "app/startup/TestHooks.h"
#include "app/startup/WidgetPrompts.h"
#include "app/startup/modMain.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"
#include "ui/main/frmMain.h"

#include <QAbstractButton>
#include <QApplication>
#include <QInputDialog>
#include <QMessageBox>
#include <QPointer>
#include <QProcess>
#include <QtTest>

#include <sys/stat.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;

Q_DECLARE_METATYPE(Brimvault::PromptIcon)
Q_DECLARE_METATYPE(Brimvault::PromptButtons)
Q_DECLARE_METATYPE(Brimvault::PromptAnswer)

namespace {

const QString Usage = u"Usage: brimvault [OPTION [ARGUMENTS]]\n"
                      "Without an option the program starts its window.\n\n"
                      "  --help                       show this help\n"
                      "  --version                    show the program's version\n"
                      "  --extract-icon FILE OUT.ico  write the main icon of an executable as an icon file\n"
                      "  --version-info FILE          print the version information of an executable\n"
                      "  --list [--json] [--find TEXT] [--order found|name|recent]\n"
                      "                               print the games as the window lists them, without writing "
                      "anything\n"_s;

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

// Writers replace the file: a new inode tells that it was written.
qint64 inodeOf(const QString& path)
{
    struct stat st { };
    return ::stat(QFile::encodeName(path).constData(), &st) == 0 ? qint64(st.st_ino) : -1;
}

} // namespace

class TestStartup : public QObject {
    Q_OBJECT
private Q_SLOTS:
    // A window takes its menus with it: each top-level widget is deleted once, if it is still there.
    void cleanup()
    {
        SetPromptHandler({});
        SetInputHandler({});
        qunsetenv("BRIMVAULT_PROMPT_LOG");
        QList<QPointer<QWidget>> windows;
        for (QWidget* widget : QApplication::topLevelWidgets())
            windows << widget;
        for (const QPointer<QWidget>& window : windows)
            delete window.data();
    }

    void needsNoDisplay_data()
    {
        QTest::addColumn<QByteArrayList>("argv");
        QTest::addColumn<bool>("noDisplay");
        QTest::newRow("no arguments") << QByteArrayList {"brimvault"} << false;
        QTest::newRow("command") << QByteArrayList {"brimvault", "--version"} << true;
        QTest::newRow("unknown option") << QByteArrayList {"brimvault", "--bogus"} << true;
        QTest::newRow("plain word") << QByteArrayList {"brimvault", "game.exe"} << true;
        QTest::newRow("Qt option, one dash") << QByteArrayList {"brimvault", "-style", "fusion"} << false;
        QTest::newRow("Qt option, two dashes") << QByteArrayList {"brimvault", "--platform", "xcb"} << false;
        QTest::newRow("Qt option with value") << QByteArrayList {"brimvault", "--style=fusion"} << false;
    }
    void needsNoDisplay()
    {
        QFETCH(QByteArrayList, argv);
        std::vector<const char*> pointers;
        for (const QByteArray& argument : argv)
            pointers.push_back(argument.constData());
        QTEST(CommandLine::NeedsNoDisplay(int(pointers.size()), pointers.data()), "noDisplay");
    }

    void realProgram_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("exitCode");
        QTest::addColumn<QString>("out"); // the whole standard output
        QTest::addColumn<QString>("err"); // the complaint, followed by the usage

        QTest::newRow("version") << QStringList {u"--version"_s} << 0 << u"Brimvault " BRIMVAULT_VERSION "\n"_s
                                 << QString();
        QTest::newRow("help") << QStringList {u"--help"_s} << 0 << Usage << QString();
        QTest::newRow("unknown option") << QStringList {u"--bogus"_s} << 2 << QString() << u"Unknown option: --bogus"_s;
        QTest::newRow("option in the wrong case")
            << QStringList {u"--HELP"_s} << 2 << QString() << u"Unknown option: --HELP"_s;
        QTest::newRow("too many arguments")
            << QStringList {u"--version"_s, u"x"_s} << 2 << QString() << u"Wrong number of arguments for --version"_s;
        QTest::newRow("too few arguments") << QStringList {u"--extract-icon"_s, u"a.exe"_s} << 2 << QString()
                                           << u"Wrong number of arguments for --extract-icon"_s;
    }
    // Run with no display and no platform chosen: a command must still work, and writes nothing.
    void realProgram()
    {
        QFETCH(QStringList, arguments);
        QFETCH(QString, err);
        TestEnvironment env;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        for (const char* name : {"QT_QPA_PLATFORM", "DISPLAY", "WAYLAND_DISPLAY"})
            environment.remove(QString::fromLatin1(name));
        QProcess program;
        program.setProcessEnvironment(environment);
        program.start(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"), arguments);
        QVERIFY(program.waitForFinished(20000));
        QCOMPARE(program.exitStatus(), QProcess::NormalExit);
        QTEST(program.exitCode(), "exitCode");
        QTEST(QString::fromLocal8Bit(program.readAllStandardOutput()), "out");
        const QString complaint = QString::fromLocal8Bit(program.readAllStandardError());
        QVERIFY2(err.isEmpty() ? !complaint.contains(u"Usage") : complaint.endsWith(err + u'\n' + Usage),
            qPrintable(complaint));
        QVERIFY(!QFileInfo::exists(env.settingsFile()));
    }

    // Every box is written down and answered with the button that does not go ahead.
    void promptLog()
    {
        TestEnvironment env;
        const QString log = env.path(u"prompts.jsonl"_s);
        QVERIFY(!TestHooks::InstallPromptLogIfRequested());
        qputenv("BRIMVAULT_PROMPT_LOG", log.toLocal8Bit());
        QVERIFY(TestHooks::InstallPromptLogIfRequested());
        const QList<PromptAnswer> answers {
            ShowPrompt({u"Remove Chess?\nReally?"_s, u"Brimvault"_s, PromptIcon::Critical, PromptButtons::Ok}),
            ShowPrompt({u"b"_s, u"t"_s, PromptIcon::Exclamation, PromptButtons::OkCancel}),
            ShowPrompt({u"c"_s, u"t"_s, PromptIcon::Question, PromptButtons::YesNo}),
            ShowPrompt({u"d"_s, u"t"_s, PromptIcon::None, PromptButtons::YesNoCancel})};
        QCOMPARE(answers, QList({PromptAnswer::Ok, PromptAnswer::Cancel, PromptAnswer::No, PromptAnswer::Cancel}));
        QCOMPARE(AskInput({u"Edit game name"_s, u"Brimvault"_s, u"Chess"_s}), std::nullopt);
        // Written with ' for " here.
        const QByteArrayList logged {
            "{'buttons':'ok','icon':'critical','kind':'message','text':'Remove Chess?\\nReally?','title':'Brimvault'}",
            "{'buttons':'okcancel','icon':'exclamation','kind':'message','text':'b','title':'t'}",
            "{'buttons':'yesno','icon':'question','kind':'message','text':'c','title':'t'}",
            "{'buttons':'yesnocancel','icon':'none','kind':'message','text':'d','title':'t'}",
            "{'kind':'input','text':'Edit game name','title':'Brimvault'}"};
        QCOMPARE(ReadFile(log), logged.join('\n').replace('\'', '"') + '\n');
    }

    void messageBox_data()
    {
        QTest::addColumn<PromptIcon>("icon");
        QTest::addColumn<PromptButtons>("buttons");
        QTest::addColumn<int>("click"); // a QMessageBox::StandardButton, or 0 for Escape
        QTest::addColumn<int>("shownIcon");
        QTest::addColumn<PromptAnswer>("answer");
        QTest::newRow("critical, OK") << PromptIcon::Critical << PromptButtons::Ok << int(QMessageBox::Ok)
                                      << int(QMessageBox::Critical) << PromptAnswer::Ok;
        QTest::newRow("question, yes") << PromptIcon::Question << PromptButtons::YesNo << int(QMessageBox::Yes)
                                       << int(QMessageBox::Question) << PromptAnswer::Yes;
        QTest::newRow("question, escape means no")
            << PromptIcon::Question << PromptButtons::YesNo << 0 << int(QMessageBox::Question) << PromptAnswer::No;
        QTest::newRow("exclamation, cancel")
            << PromptIcon::Exclamation << PromptButtons::OkCancel << int(QMessageBox::Cancel)
            << int(QMessageBox::Warning) << PromptAnswer::Cancel;
        QTest::newRow("information, no of three")
            << PromptIcon::Information << PromptButtons::YesNoCancel << int(QMessageBox::No)
            << int(QMessageBox::Information) << PromptAnswer::No;
        QTest::newRow("escape of three cancels")
            << PromptIcon::None << PromptButtons::YesNoCancel << 0 << int(QMessageBox::NoIcon) << PromptAnswer::Cancel;
    }
    void messageBox()
    {
        QFETCH(PromptIcon, icon);
        QFETCH(PromptButtons, buttons);
        QFETCH(int, click);
        InstallWidgetPrompts();
        QStringList seen;
        WhenModalShows([&](QWidget* widget) {
            auto* box = qobject_cast<QMessageBox*>(widget);
            QVERIFY(box);
            seen << box->text() << box->windowTitle() << QString::number(box->icon());
            if (click == 0)
                QTest::keyClick(box, Qt::Key_Escape);
            else
                box->button(QMessageBox::StandardButton(click))->click();
        });
        QTEST(ShowPrompt({u"Remove the game?"_s, u"Brimvault"_s, icon, buttons}), "answer");
        QFETCH(int, shownIcon);
        QCOMPARE(seen, QStringList({u"Remove the game?"_s, u"Brimvault"_s, QString::number(shownIcon)}));
    }

    void inputBox_data()
    {
        QTest::addColumn<bool>("accept");
        QTest::addColumn<QString>("typed");
        QTest::newRow("accepted with new text") << true << u"Solitaire"_s;
        QTest::newRow("accepted empty") << true << QString();
        QTest::newRow("cancelled") << false << u"ignored"_s;
    }
    void inputBox()
    {
        QFETCH(bool, accept);
        QFETCH(QString, typed);
        InstallWidgetPrompts();
        QString seenDefault;
        WhenModalShows([&](QWidget* widget) {
            auto* dialog = qobject_cast<QInputDialog*>(widget);
            QVERIFY(dialog);
            seenDefault = dialog->textValue();
            dialog->setTextValue(typed);
            accept ? dialog->accept() : dialog->reject();
        });
        const std::optional<QString> result = AskInput({u"New name:"_s, u"Rename"_s, u"Old name"_s});
        QCOMPARE(seenDefault, u"Old name"_s);
        QCOMPARE(result, accept ? std::optional<QString>(typed) : std::nullopt);
    }

    // The components are checked in order: the first that fails stops start-up with the one message, and those
    // after it are never registered, let alone loaded. A second start opens no second window.
    void componentsCheckedInOrder_data()
    {
        QTest::addColumn<QString>("velloran"); // the stand-in for Velloran; empty: the real one
        QTest::addColumn<int>("usable"); // how many components, from the first, end up usable
        QTest::newRow("all real") << QString() << 5;
        for (const char* kind : {"RegisterFails", "RegistersNothing", "NoGetVersion"})
            QTest::newRow(kind) << QString::fromLatin1(kind) << 2;
    }
    void componentsCheckedInOrder()
    {
        QFETCH(QString, velloran);
        QFETCH(int, usable);
        TestEnvironment env;
        PromptRecorder prompts;
        QVERIFY(addComponents(env, u"Velloran"_s, velloran));
        modMain::Main();
        for (int i = 0; i < Prefixes.size(); ++i) {
            const bool ok = i < usable;
            QCOMPARE(savedVersion(Prefixes[i]), ok ? QStringLiteral(BRIMVAULT_VERSION) : u"-"_s);
            if (i != usable) // the failing one may or may not have registered itself
                QCOMPARE(RegisteredLibrary(Prefixes[i] + u".clsVersion"_s),
                    ok ? env.programDir() + u'/' + CompanionComponentFile(Prefixes[i]) : QString());
        }
        QCOMPARE(prompts.texts(),
            usable == 5 ? QStringList() : QStringList {u"You need to run the program as administrator!"_s});
        modMain::Main();
        QCOMPARE(visibleMainWindows(), usable == 5 ? 1 : 0);
    }

    void versionComparison_data()
    {
        QTest::addColumn<QString>("saved"); // a null text: no value saved
        QTest::addColumn<QString>("installed");
        QTest::addColumn<bool>("written");
        QTest::newRow("unchanged") << u"1.0.0"_s << u"1.0.0"_s << false;
        QTest::newRow("differs only in case") << u"2.0.0-beta"_s << u"2.0.0-Beta"_s << true;
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
        const qint64 settingsBefore = inodeOf(env.settingsFile());
        const qint64 registryBefore = inodeOf(ComponentRegistryPath());

        // The checks alone: localisation, which Main runs next, keeps its own settings.
        for (const QString& prefix : Prefixes)
            QVERIFY2(modMain::CheckComponent(prefix), qPrintable(prefix));

        QVERIFY(prompts.prompts.isEmpty());
        QCOMPARE(savedVersion(u"Quillet"_s), installed.isNull() ? u"-"_s : installed);
        QTEST(inodeOf(env.settingsFile()) != settingsBefore, "written");
        QCOMPARE(inodeOf(ComponentRegistryPath()), registryBefore);
    }
};

QTEST_MAIN(TestStartup)
#include "tst_startup.moc"
