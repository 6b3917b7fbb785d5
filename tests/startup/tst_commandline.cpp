// The program's command line: which arguments start the window, and what the real program prints for a command.
#include "TestEnvironment.h"
#include "TestSuite.h"

#include "app/startup/CommandLine.h"

#include <QProcess>
#include <QtTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

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

} // namespace

class TestCommandLine : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void needsNoDisplay_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<bool>("noDisplay");
        QTest::newRow("no arguments") << QStringList() << false;
        QTest::newRow("command") << QStringList {u"--version"_s} << true;
        QTest::newRow("unknown option") << QStringList {u"--bogus"_s} << true;
        QTest::newRow("plain word") << QStringList {u"game.exe"_s} << true;
        QTest::newRow("Qt option, one dash") << QStringList {u"-style"_s, u"fusion"_s} << false;
        QTest::newRow("Qt option, two dashes") << QStringList {u"--platform"_s, u"xcb"_s} << false;
        QTest::newRow("Qt option with value") << QStringList {u"--style=fusion"_s} << false;
    }
    void needsNoDisplay()
    {
        QFETCH(QStringList, arguments);
        QList<QByteArray> storage {"brimvault"};
        for (const QString& argument : arguments)
            storage.append(argument.toLocal8Bit());
        std::vector<const char*> argv;
        for (const QByteArray& argument : storage)
            argv.push_back(argument.constData());
        QTEST(CommandLine::NeedsNoDisplay(int(argv.size()), argv.data()), "noDisplay");
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
        QTest::newRow("plain word") << QStringList {u"game.exe"_s} << 2 << QString() << u"Unknown option: game.exe"_s;
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
};

BV_REGISTER_TEST(TestCommandLine);
#include "tst_commandline.moc"
