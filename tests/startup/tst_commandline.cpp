#include "app/startup/CommandLine.h"

#include "TestEnvironment.h"

#include <QProcess>
#include <QtTest>

using namespace Brimvault;

class TestCommandLine : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void dispatch_data();
    void dispatch();
    void usageListsEveryCommand();
    void needsNoDisplay_data();
    void needsNoDisplay();
    void realProgram_data();
    void realProgram();
};

void TestCommandLine::dispatch_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<int>("exitCode"); // -1: no command, the window starts

    QTest::newRow("no arguments") << QStringList() << -1;
    QTest::newRow("help") << QStringList {QStringLiteral("--help")} << 0;
    QTest::newRow("version") << QStringList {QStringLiteral("--version")} << 0;
    QTest::newRow("unknown option") << QStringList {QStringLiteral("--bogus")} << CommandLine::UsageExitCode;
    QTest::newRow("option in the wrong case") << QStringList {QStringLiteral("--HELP")} << CommandLine::UsageExitCode;
    QTest::newRow("plain word") << QStringList {QStringLiteral("game.exe")} << CommandLine::UsageExitCode;
    QTest::newRow("too many arguments") << QStringList {QStringLiteral("--version"), QStringLiteral("x")}
                                        << CommandLine::UsageExitCode;
}

void TestCommandLine::dispatch()
{
    QFETCH(QStringList, arguments);
    QFETCH(int, exitCode);
    const std::optional<int> result = CommandLine::Dispatch(arguments);
    QCOMPARE(result.value_or(-1), exitCode);
}

void TestCommandLine::usageListsEveryCommand()
{
    const QString usage = CommandLine::Usage();
    const QList<CommandLine::Command> commands = CommandLine::Commands();
    QVERIFY(!commands.isEmpty());
    for (const CommandLine::Command& command : commands) {
        QVERIFY2(usage.contains(command.option), qPrintable(command.option));
        QVERIFY(usage.contains(command.description));
    }
}

void TestCommandLine::needsNoDisplay_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<bool>("noDisplay");

    QTest::newRow("no arguments") << QStringList() << false;
    QTest::newRow("command") << QStringList {QStringLiteral("--version")} << true;
    QTest::newRow("unknown option") << QStringList {QStringLiteral("--bogus")} << true;
    QTest::newRow("plain word") << QStringList {QStringLiteral("game.exe")} << true;
    QTest::newRow("Qt option, one dash") << QStringList {QStringLiteral("-style"), QStringLiteral("fusion")} << false;
    QTest::newRow("Qt option, two dashes")
        << QStringList {QStringLiteral("--platform"), QStringLiteral("xcb")} << false;
    QTest::newRow("Qt option with value") << QStringList {QStringLiteral("--style=fusion")} << false;
}

void TestCommandLine::needsNoDisplay()
{
    QFETCH(QStringList, arguments);
    QFETCH(bool, noDisplay);
    QList<QByteArray> storage {QByteArrayLiteral("brimvault")};
    for (const QString& argument : arguments)
        storage.append(argument.toLocal8Bit());
    std::vector<const char*> argv;
    for (const QByteArray& argument : storage)
        argv.push_back(argument.constData());
    QCOMPARE(CommandLine::NeedsNoDisplay(int(argv.size()), argv.data()), noDisplay);
}

void TestCommandLine::realProgram_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<int>("exitCode");
    QTest::addColumn<QString>("stdoutText");
    QTest::addColumn<QString>("stderrText");

    QTest::newRow("version") << QStringList {QStringLiteral("--version")} << 0
                             << QStringLiteral("Brimvault " BRIMVAULT_VERSION "\n") << QString();
    QTest::newRow("help") << QStringList {QStringLiteral("--help")} << 0 << QStringLiteral("Usage:") << QString();
    QTest::newRow("unknown option") << QStringList {QStringLiteral("--bogus")} << 2 << QString()
                                    << QStringLiteral("Unknown option: --bogus");
}

// Run with no display and no platform chosen: a command must still work.
void TestCommandLine::realProgram()
{
    QFETCH(QStringList, arguments);
    QFETCH(int, exitCode);
    QFETCH(QString, stdoutText);
    QFETCH(QString, stderrText);

    TestEnvironment env;
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.remove(QStringLiteral("QT_QPA_PLATFORM"));
    environment.remove(QStringLiteral("DISPLAY"));
    environment.remove(QStringLiteral("WAYLAND_DISPLAY"));
    QProcess program;
    program.setProcessEnvironment(environment);
    program.start(QStringLiteral(BRIMVAULT_BIN_DIR) + QStringLiteral("/brimvault"), arguments);
    QVERIFY(program.waitForFinished(20000));
    const QString out = QString::fromLocal8Bit(program.readAllStandardOutput());
    const QString err = QString::fromLocal8Bit(program.readAllStandardError());
    QCOMPARE(program.exitStatus(), QProcess::NormalExit);
    QVERIFY2(program.exitCode() == exitCode, qPrintable(err));
    if (stdoutText.isEmpty())
        QVERIFY(out.isEmpty());
    else if (stdoutText.endsWith(u'\n'))
        QCOMPARE(out, stdoutText);
    else
        QVERIFY2(out.contains(stdoutText), qPrintable(out));
    if (!stderrText.isEmpty()) {
        QVERIFY2(err.contains(stderrText), qPrintable(err));
        QVERIFY(err.contains(QStringLiteral("Usage:")));
    }
    // Nothing may have been written for a command-line run.
    QVERIFY(!QFileInfo::exists(env.settingsFile()));
}

QTEST_GUILESS_MAIN(TestCommandLine)
#include "tst_commandline.moc"
