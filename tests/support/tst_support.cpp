#include "support/CommandLine.h"
#include "support/PathFunctions.h"
#include "support/SystemFolders.h"
#include "support/TextCase.h"
#include "support/modShelAndWaitl.h"

#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QElapsedTimer>
#include <QStandardPaths>
#include <QTimer>

#include <csignal>
#include <unistd.h>

using namespace Brimvault;
using namespace Brimvault::modShelAndWaitl;

namespace {

volatile sig_atomic_t foreignHandlerCalls = 0;
void foreignHandler(int)
{
    foreignHandlerCalls = foreignHandlerCalls + 1;
}

} // namespace

class tst_Support : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_savedPath = qgetenv("PATH");
        qputenv("PATH", m_env->path(u"bin"_qs).toLocal8Bit() + ':' + m_savedPath);
        for (const char* program : {"program/BrimvaultService", "program/shadowed", "bin/shadowed", "bin/onpath",
                 "bin/wine", "my games/run game"})
            QVERIFY(WriteExecutable(m_env->path(QString::fromLatin1(program))));
        QVERIFY(WriteFile(m_env->path(u"my games/run"_qs), "not a program"));
        QVERIFY(WriteFile(m_env->path(u"games/game.exe"_qs), QByteArray("MZ\x90\x00", 4)));
        m_env->programDir();
    }

    void cleanup()
    {
        qputenv("PATH", m_savedPath);
        m_env.reset();
    }

    // "{root}" stands for the temporary tree; an empty program means nothing can be started.
    void resolve_data()
    {
        QTest::addColumn<QString>("commandLine");
        QTest::addColumn<QString>("program");
        QTest::addColumn<QStringList>("arguments");
        const QString none;
        QTest::newRow("exe name finds native companion")
            << u"BrimvaultService.exe -I \"{root}/a b.bvxpak\""_qs << u"{root}/program/BrimvaultService"_qs
            << QStringList {u"-I"_qs, u"{root}/a b.bvxpak"_qs};
        QTest::newRow("program folder before PATH") << u"shadowed"_qs << u"{root}/program/shadowed"_qs << QStringList();
        QTest::newRow("PATH") << u"  onpath  x  "_qs << u"{root}/bin/onpath"_qs << QStringList {u"x"_qs};
        QTest::newRow("unquoted path with blanks")
            << u"{root}/my games/run game -a \"b c\""_qs << u"{root}/my games/run game"_qs
            << QStringList {u"-a"_qs, u"b c"_qs};
        QTest::newRow("quoted path") << u"\"{root}/my games/run game\" \"x  y\" z"_qs << u"{root}/my games/run game"_qs
                                     << QStringList {u"x  y"_qs, u"z"_qs};
        QTest::newRow("Windows executable through the runner")
            << u"{root}/games/game.exe -windowed"_qs << u"{root}/bin/wine"_qs
            << QStringList {u"{root}/games/game.exe"_qs, u"-windowed"_qs};
        QTest::newRow("missing program") << u"no-such-program-brimvault -x"_qs << none << QStringList();
        QTest::newRow("not executable") << u"{root}/my games/run"_qs << none << QStringList();
        QTest::newRow("folder") << u"{root}/my games"_qs << none << QStringList();
        QTest::newRow("quoted, blank inside") << u"\"{root}/my games/run game \""_qs << none << QStringList();
        QTest::newRow("empty quotes") << u"\"\" x"_qs << none << QStringList();
    }
    void resolve()
    {
        QFETCH(QString, commandLine);
        QFETCH(QString, program);
        QFETCH(QStringList, arguments);
        const auto resolved = ResolveCommandLine(commandLine.replace(u"{root}"_qs, m_env->root()));
        QCOMPARE(resolved ? resolved->program : QString(), program.replace(u"{root}"_qs, m_env->root()));
        QCOMPARE(
            resolved ? resolved->arguments : QStringList(), arguments.replaceInStrings(u"{root}"_qs, m_env->root()));
    }

    void windowsExecutableWithoutRunner()
    {
        qputenv("PATH", m_env->path(u"program"_qs).toLocal8Bit());
        QVERIFY(!ResolveCommandLine(m_env->path(u"games/game.exe"_qs)));
    }

    // "program" is the fallback, below the tree like the others.
    void specialFolders_data()
    {
        QTest::addColumn<int>("csidl");
        QTest::addColumn<QString>("suffix");
        QTest::addColumn<QString>("expected");
        QTest::newRow("common appdata") << 35 << u"\\Brimvault\\Icons\\"_qs << u"commonappdata/Brimvault/Icons/"_qs;
        QTest::newRow("personal") << 5 << QString() << u"personal"_qs;
        QTest::newRow("program files") << 38 << u"\\Microsoft Games"_qs << u"programfiles/Microsoft Games"_qs;
        QTest::newRow("unknown code") << 999 << u"\\x"_qs << u"program"_qs;
    }
    void specialFolders()
    {
        QFETCH(int, csidl);
        QFETCH(QString, suffix);
        QFETCH(QString, expected);
        QCOMPARE(GetSpecialFolder(csidl, suffix), m_env->path(expected));
    }

    // A variable set to blanks stands for a system without that folder; one not set leaves the choice to the
    // desktop's own folders and Wine's.
    void foldersWithoutOverride()
    {
        const QString program = m_env->programDir();
        qputenv("BRIMVAULT_COMMON_APPDATA", "   ");
        QCOMPARE(GetSpecialFolder(35, u"\\Brimvault\\"_qs), program);
        for (const char* variable :
            {"BRIMVAULT_COMMON_APPDATA", "BRIMVAULT_PERSONAL", "BRIMVAULT_PROGRAM_FILES", "windir"})
            qunsetenv(variable);
        qputenv("WINEPREFIX", m_env->path(u"wine"_qs).toLocal8Bit());
        const QString data = QDir::cleanPath(QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation));
        QCOMPARE(GetSpecialFolder(35, u"\\Brimvault\\"_qs), data + u"/Brimvault/"_qs);
        QCOMPARE(GetSpecialFolder(38, u"\\Microsoft Games"_qs), program);
        QCOMPARE(WindowsFolder(), QString());
        QVERIFY(QDir().mkpath(m_env->path(u"wine/drive_c/Program Files"_qs)));
        QVERIFY(QDir().mkpath(m_env->path(u"wine/drive_c/windows"_qs)));
        QCOMPARE(GetSpecialFolder(38, u"\\Microsoft Games"_qs),
            m_env->path(u"wine/drive_c/Program Files/Microsoft Games"_qs));
        QCOMPARE(WindowsFolder(), m_env->path(u"wine/drive_c/windows"_qs));
        qunsetenv("WINEPREFIX");
    }

    void paths_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        QTest::newRow("extension, dot in folder") << GetFileExtention(u"C:/a.b/file"_qs, true, true) << u"*.;"_qs;
        QTest::newRow("extension, query cut")
            << GetFileExtention(u"http://h/p.asp?x=a.b"_qs, false, false) << u"asp"_qs;
        QTest::newRow("extension, trailing dot") << GetFileExtention(u"C:\\foo."_qs, false, false) << QString();
        QTest::newRow("name, two dots") << GetFileName(u"C:\\x.tar.gz"_qs, false) << u"x.tar"_qs;
        QTest::newRow("name gains lone dot") << GetFileName(u"C:\\a.b\\file"_qs, true) << u"file."_qs;
        QTest::newRow("name, mixed separators") << GetFileName(u"C:\\a/b\\c/d.exe"_qs, true) << u"d.exe"_qs;
        QTest::newRow("name, trailing slash") << GetFileName(u"C:\\Games\\"_qs, true) << u"."_qs;
        QTest::newRow("name, dot file") << GetFileName(u"C:\\.hidden"_qs, false) << QString();
        QTest::newRow("folder with name") << GetFileFolder(u"C:\\Games\\foo.exe"_qs, true) << u"C:\\Games\\foo"_qs;
        QTest::newRow("folder of bare name") << GetFileFolder(u"game.exe"_qs, true) << u".\\game"_qs;
        QTest::newRow("folder, mixed, slash last") << GetFileFolder(u"C:\\a/b.exe"_qs, false) << u"C:\\a\\"_qs;
        QTest::newRow("folder, root only") << GetFileFolder(u"\\foo.exe"_qs, false) << QString();
        QTest::newRow("folder, query cut") << GetFileFolder(u"http://h/a/p.asp?u=x/y"_qs, true) << u"http://h/a/p"_qs;
        QTest::newRow("slash, backslash style") << AddSlash(u"C:/a\\b"_qs) << u"C:/a\\b\\"_qs;
        QTest::newRow("slash, slash style") << AddSlash(u"C:\\a/b"_qs) << u"C:\\a/b/"_qs;
        QTest::newRow("slash, bare word") << AddSlash(u"dir"_qs) << u".\\dir\\"_qs;
        QTest::newRow("slash, query cut") << AddSlash(u"C:\\a?b\\"_qs) << u"C:\\a\\"_qs;
        QTest::newRow("upper, ASCII edges") << UpperCased(u"`az{ @AZ["_qs) << u"`AZ{ @AZ["_qs;
        QTest::newRow("lower, ASCII edges") << LowerCased(u"@AZ[ `az{"_qs) << u"@az[ `az{"_qs;
        QTest::newRow("fold, ASCII edges") << CaseFolded(u"@AZ[ `az{"_qs) << u"@az[ `az{"_qs;
        QTest::newRow("upper beyond ASCII") << UpperCased(u"straße ä"_qs) << u"STRASSE Ä"_qs;
        QTest::newRow("fold beyond ASCII") << CaseFolded(u"Ä\u212A"_qs) << u"äk"_qs;
        QTest::newRow("found ignoring case")
            << QString::number(IndexOfIgnoringCase(u"<>ab<>NAME<x"_qs, u"<>Name<"_qs, 1)) << u"4"_qs;
        QTest::newRow("Kelvin sign is a k")
            << QString::number(IndexOfIgnoringCase(u"<>\u212Aey<"_qs, u"<>KEY<"_qs, 0)) << u"0"_qs;
    }
    void paths()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    // "%1" stands for a file the started program writes its id into.
    void arguments_data()
    {
        QTest::addColumn<QString>("commandLine");
        QTest::addColumn<int>("timeoutMs");
        QTest::addColumn<int>("windowStyle");
        QTest::addColumn<int>("breakAction");
        QTest::addColumn<int>("result");
        const QString starts = QStringLiteral("sh -c \"echo $$ > '%1'; exit 3\"");
        QTest::newRow("blanks") << u"   "_qs << 0 << 1 << 0 << 3;
        QTest::newRow("negative time-out") << starts << -1 << 1 << 0 << 3;
        for (int style : {-1, 5, 7})
            QTest::addRow("window style %d", style) << starts << 0 << style << 0 << 3;
        for (int style : {0, 4, 6})
            QTest::addRow("window style %d", style) << starts << 0 << style << 2 << 0;
        QTest::newRow("break action 3") << starts << 0 << 1 << 3 << 3;
        // Which command lines can be started is ResolveCommandLine's rule, tested there.
        QTest::newRow("cannot start") << u"no-such-program-brimvault --flag"_qs << 0 << 1 << 0 << 1;
    }
    void arguments()
    {
        QFETCH(QString, commandLine);
        QFETCH(int, timeoutMs);
        QFETCH(int, windowStyle);
        QFETCH(int, breakAction);
        QFETCH(int, result);
        QCOMPARE(ShellAndWait(commandLine.replace(u"%1"_qs, pidFile()), timeoutMs, windowStyle, breakAction), result);
        QTest::qSleep(result == 3 ? 100 : 0);
        QCOMPARE(QFile::exists(pidFile()), result == 0);
        if (result == 0) // reaped: no zombie left behind
            QVERIFY(!QFile::exists(QStringLiteral("/proc/%1").arg(readPid())));
    }

    // The limit is counted in polls of 500 ms, strictly exceeded: 500 ms give up after the second wait. The
    // process goes on afterwards.
    void timeOutCountsPolls()
    {
        QElapsedTimer clock;
        clock.start();
        QCOMPARE(ShellAndWait(sleeper(20), 500, 0, 1), 2);
        QVERIFY(clock.elapsed() >= 950);
        QTest::qSleep(100);
        killAfterCheckingAlive();
    }

    // Our input is a pipe that never ends and another of our files is open: the program sees an end of
    // its input at once and none of our files.
    void startedProgramGetsNothingOfOurs()
    {
        int pipeEnds[2];
        QCOMPARE(::pipe(pipeEnds), 0);
        const int savedInput = ::dup(STDIN_FILENO);
        ::dup2(pipeEnds[0], STDIN_FILENO);
        const QString probe = QStringLiteral("sh -c \"cat; [ -e /proc/self/fd/%1 ] && echo inherited > '%2'\"");
        const int result = ShellAndWait(probe.arg(pipeEnds[1]).arg(pidFile()), 3000, 0, 0);
        ::dup2(savedInput, STDIN_FILENO);
        for (int descriptor : {savedInput, pipeEnds[0], pipeEnds[1]})
            ::close(descriptor);
        QCOMPARE(result, 0);
        QVERIFY(!QFile::exists(pidFile()));
    }

    void userBreak_data()
    {
        QTest::addColumn<bool>("bySignal");
        QTest::addColumn<int>("breakAction");
        QTest::addColumn<PromptAnswer>("answer");
        QTest::addColumn<int>("expected");
        for (bool bySignal : {false, true}) {
            const char* via = bySignal ? "SIGINT" : "request";
            QTest::addRow("%s, ignore", via) << bySignal << 0 << PromptAnswer::Yes << 0;
            QTest::addRow("%s, give up", via) << bySignal << 1 << PromptAnswer::Yes << 5;
            QTest::addRow("%s, ask, Yes", via) << bySignal << 2 << PromptAnswer::Yes << 0;
            QTest::addRow("%s, ask, No", via) << bySignal << 2 << PromptAnswer::No << 6;
        }
    }
    // The started program itself interrupts us during the first wait, once the wait runs (and so the handler is in
    // place); a request comes from an event handled at the first pump. Only the wait ends: the process goes on.
    // A break asked for before the wait is forgotten, and our own interrupt handler is back afterwards.
    void userBreak()
    {
        QFETCH(bool, bySignal);
        QFETCH(int, breakAction);
        QFETCH(PromptAnswer, answer);
        QFETCH(int, expected);
        PromptRecorder prompts(answer);
        struct sigaction foreign = {}, original = {};
        foreign.sa_handler = foreignHandler;
        QCOMPARE(sigaction(SIGINT, &foreign, &original), 0);
        RequestUserBreak();
        if (!bySignal)
            QTimer::singleShot(0, this, [] { RequestUserBreak(); });
        const QString interrupting = u"sh -c \"echo $$ > '%1'; sleep 0.2; kill -INT $PPID; exec sleep 1\""_qs;
        const int result = ShellAndWait(bySignal ? interrupting.arg(pidFile()) : sleeper(1.2), 0, 1, breakAction);
        foreignHandlerCalls = 0;
        ::raise(SIGINT);
        sigaction(SIGINT, &original, nullptr);
        QCOMPARE(int(foreignHandlerCalls), 1);
        QCOMPARE(result, expected);
        QCOMPARE(prompts.texts(),
            breakAction == 2 ? QStringList {u"User Process Break.\r\nContinue to wait?"_qs} : QStringList());
        const PromptRequest& asked = prompts.prompts.value(0);
        QVERIFY(breakAction != 2
            || (asked.title == u"Brimvault" && asked.buttons == PromptButtons::YesNo
                && asked.icon == PromptIcon::None));
        if (expected != 0)
            killAfterCheckingAlive();
    }

private:
    QString pidFile() const { return m_env->path(QStringLiteral("pid")); }
    qint64 readPid() const { return ReadFile(pidFile()).trimmed().toLongLong(); }
    QString sleeper(double seconds) const
    {
        return QStringLiteral("sh -c \"echo $$ > '%1'; exec sleep %2\"").arg(pidFile()).arg(seconds);
    }
    // Nobody but the wait's own reaper can collect it: a lasting zombie would keep /proc/<pid>.
    void killAfterCheckingAlive()
    {
        const qint64 pid = readPid();
        const QByteArray stat = ReadFile(QStringLiteral("/proc/%1/stat").arg(pid));
        QVERIFY(pid > 0 && stat.size() > stat.lastIndexOf(')') + 2 && stat.at(stat.lastIndexOf(')') + 2) != 'Z');
        ::kill(static_cast<pid_t>(pid), SIGKILL);
        QTRY_VERIFY_WITH_TIMEOUT(!QFile::exists(QStringLiteral("/proc/%1").arg(pid)), 5000);
    }

    std::unique_ptr<TestEnvironment> m_env;
    QByteArray m_savedPath;
};

BV_REGISTER_TEST(tst_Support);
#include "tst_support.moc"
