// The program's command line: what starts the window, what needs no display, what the real program prints.
#include "TestEnvironment.h"
#include "TestSuite.h"

#include "app/startup/CommandLine.h"

#include <QProcess>
#include <QtTest>

using namespace Brimvault;

class TestCommandLine : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void dispatch_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("exitCode"); // -1: no command, the window starts

        QTest::newRow("no arguments") << QStringList() << -1;
        QTest::newRow("option in the wrong case") << QStringList {QStringLiteral("--HELP")} << 2;
        QTest::newRow("plain word") << QStringList {QStringLiteral("game.exe")} << 2;
        QTest::newRow("too many arguments") << QStringList {QStringLiteral("--version"), QStringLiteral("x")} << 2;
    }

    void dispatch()
    {
        QFETCH(QStringList, arguments);
        QFETCH(int, exitCode);
        QCOMPARE(CommandLine::Dispatch(arguments).value_or(-1), exitCode);
    }

    void needsNoDisplay_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<bool>("noDisplay");

        QTest::newRow("no arguments") << QStringList() << false;
        QTest::newRow("command") << QStringList {QStringLiteral("--version")} << true;
        QTest::newRow("unknown option") << QStringList {QStringLiteral("--bogus")} << true;
        QTest::newRow("plain word") << QStringList {QStringLiteral("game.exe")} << true;
        QTest::newRow("Qt option, one dash")
            << QStringList {QStringLiteral("-style"), QStringLiteral("fusion")} << false;
        QTest::newRow("Qt option, two dashes")
            << QStringList {QStringLiteral("--platform"), QStringLiteral("xcb")} << false;
        QTest::newRow("Qt option with value") << QStringList {QStringLiteral("--style=fusion")} << false;
    }

    void needsNoDisplay()
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

    void realProgram_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("exitCode");
        QTest::addColumn<QString>("out"); // ending in a line end: the whole output, else a part of it
        QTest::addColumn<QString>("err");

        QTest::newRow("version") << QStringList {QStringLiteral("--version")} << 0
                                 << QStringLiteral("Brimvault " BRIMVAULT_VERSION "\n") << QString();
        QTest::newRow("help") << QStringList {QStringLiteral("--help")} << 0 << QStringLiteral("Usage:") << QString();
        QTest::newRow("unknown option") << QStringList {QStringLiteral("--bogus")} << 2 << QString()
                                        << QStringLiteral("Unknown option: --bogus");
    }

    // Run with no display and no platform chosen: a command must still work, and writes nothing.
    void realProgram()
    {
        QFETCH(QStringList, arguments);
        QFETCH(int, exitCode);
        QFETCH(QString, out);
        QFETCH(QString, err);

        TestEnvironment env;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        for (const char* name : {"QT_QPA_PLATFORM", "DISPLAY", "WAYLAND_DISPLAY"})
            environment.remove(QString::fromLatin1(name));
        QProcess program;
        program.setProcessEnvironment(environment);
        program.start(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"), arguments);
        QVERIFY(program.waitForFinished(20000));
        const QString printed = QString::fromLocal8Bit(program.readAllStandardOutput());
        const QString complaint = QString::fromLocal8Bit(program.readAllStandardError());
        QCOMPARE(program.exitStatus(), QProcess::NormalExit);
        QVERIFY2(program.exitCode() == exitCode, qPrintable(complaint));
        if (out.endsWith(u'\n'))
            QCOMPARE(printed, out);
        else
            QVERIFY2(out.isEmpty() ? printed.isEmpty() : printed.contains(out), qPrintable(printed));
        if (!err.isEmpty())
            QVERIFY2(complaint.contains(err) && complaint.contains(QStringLiteral("Usage:")), qPrintable(complaint));
        QVERIFY(!QFileInfo::exists(env.settingsFile()));
    }
};

BV_REGISTER_TEST(TestCommandLine);
#include "tst_commandline.moc"
