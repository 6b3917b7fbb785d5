#include "support/modShelAndWaitl.h"

#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QElapsedTimer>
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

class tst_ShellAndWait : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init() { m_env = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_env.reset(); }

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

    // The limit is counted in polls of 500 ms, strictly exceeded; the process goes on afterwards.
    void timeOutCountsPolls_data()
    {
        QTest::addColumn<int>("timeoutMs");
        QTest::addColumn<int>("polls");
        QTest::newRow("499 ms: after the first wait") << 499 << 1;
        QTest::newRow("500 ms: after the second wait") << 500 << 2;
    }
    void timeOutCountsPolls()
    {
        QFETCH(int, timeoutMs);
        QFETCH(int, polls);
        QElapsedTimer clock;
        clock.start();
        QCOMPARE(ShellAndWait(sleeper(20), timeoutMs, 0, 1), 2);
        QVERIFY(clock.elapsed() >= polls * 500 - 50);
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
        if (breakAction == 2) {
            QCOMPARE(prompts.prompts[0].title, u"Brimvault"_qs);
            QCOMPARE(prompts.prompts[0].buttons, PromptButtons::YesNo);
            QCOMPARE(prompts.prompts[0].icon, PromptIcon::None);
        }
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
};

BV_REGISTER_TEST(tst_ShellAndWait);
#include "tst_shellandwait.moc"
