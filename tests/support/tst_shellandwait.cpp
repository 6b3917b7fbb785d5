#include "support/modShelAndWaitl.h"

#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QTest>
#include <QTimer>

#include <csignal>
#include <thread>
#include <unistd.h>

using namespace Brimvault;
using namespace Brimvault::modShelAndWaitl;

namespace {

// Counts how often pending events are handled: it posts itself again each time it is delivered, and an
// event posted while events are being handled waits for the next round.
class PumpCounter : public QObject {
public:
    PumpCounter() { QCoreApplication::postEvent(this, new QEvent(QEvent::User)); }
    int rounds = 0;

protected:
    bool event(QEvent* event) override
    {
        if (event->type() != QEvent::User)
            return QObject::event(event);
        ++rounds;
        QCoreApplication::postEvent(this, new QEvent(QEvent::User));
        return true;
    }
};

bool processIsAlive(qint64 pid)
{
    const QByteArray stat = ReadFile(QStringLiteral("/proc/%1/stat").arg(pid));
    const qsizetype afterName = stat.lastIndexOf(')');
    return afterName > 0 && stat.size() > afterName + 2 && stat.at(afterName + 2) != 'Z';
}

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
        for (int style : {0, 1, 2, 3, 4, 6})
            QTest::addRow("window style %d", style) << starts << 0 << style << 2 << 0;
        QTest::newRow("break action 3") << starts << 0 << 1 << 3 << 3;
        QTest::newRow("break action -1") << starts << 0 << 1 << -1 << 3;
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
        QTest::newRow("1 ms: after the first wait") << 1 << 1;
        QTest::newRow("499 ms: after the first wait") << 499 << 1;
        QTest::newRow("500 ms: after the second wait") << 500 << 2;
        QTest::newRow("1000 ms: after the third wait") << 1000 << 3;
    }
    void timeOutCountsPolls()
    {
        QFETCH(int, timeoutMs);
        QFETCH(int, polls);
        PumpCounter counter;
        QElapsedTimer clock;
        clock.start();
        QCOMPARE(ShellAndWait(sleeper(20), timeoutMs, 0, 1), 2);
        QCOMPARE(counter.rounds, polls);
        QVERIFY2(clock.elapsed() >= polls * 500 - 50, qPrintable(QString::number(clock.elapsed())));
        QTest::qSleep(100);
        QVERIFY(processIsAlive(readPid()));
        killAndAwaitReaping(readPid());
    }

    void pumpsOnlyWhileWaiting()
    {
        PumpCounter counter;
        RequestUserBreak(); // outside a wait: forgotten
        QCOMPARE(ShellAndWait(u"sleep 1.2"_qs, 0, 1, 1), 0);
        QCOMPARE(counter.rounds, 2);
        PumpCounter quick;
        QCOMPARE(ShellAndWait(u"true"_qs, 0, 1, 0), 0);
        QCOMPARE(quick.rounds, 0);
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
    void userBreak()
    {
        QFETCH(bool, bySignal);
        QFETCH(int, breakAction);
        QFETCH(PromptAnswer, answer);
        QFETCH(int, expected);
        PromptRecorder prompts(answer);
        // A signal arrives during the first wait, once the program runs (and so the handler is in place);
        // a request comes from an event handled at the first pump.
        std::thread interrupter;
        if (bySignal) {
            interrupter = std::thread([started = QFile::encodeName(pidFile())] {
                for (int tries = 0; tries < 500 && ::access(started.constData(), F_OK) != 0; ++tries)
                    std::this_thread::sleep_for(std::chrono::milliseconds(5));
                std::this_thread::sleep_for(std::chrono::milliseconds(100));
                ::kill(::getpid(), SIGINT);
            });
        } else {
            QTimer::singleShot(0, this, [] { RequestUserBreak(); });
        }
        const int result = ShellAndWait(sleeper(1.2), 0, 1, breakAction);
        if (interrupter.joinable())
            interrupter.join();
        QCOMPARE(result, expected);
        if (breakAction == 2) {
            QCOMPARE(prompts.prompts.size(), 1);
            QCOMPARE(prompts.prompts[0].text, u"User Process Break.\r\nContinue to wait?"_qs);
            QCOMPARE(prompts.prompts[0].title, u"Brimvault"_qs);
            QCOMPARE(prompts.prompts[0].buttons, PromptButtons::YesNo);
            QCOMPARE(prompts.prompts[0].icon, PromptIcon::None);
        } else {
            QVERIFY(prompts.prompts.isEmpty());
        }
        if (expected != 0) { // only the wait ends; the process goes on
            QVERIFY(processIsAlive(readPid()));
            killAndAwaitReaping(readPid());
        }
    }

    void interruptHandlerIsRestored()
    {
        struct sigaction foreign = {};
        foreign.sa_handler = foreignHandler;
        sigemptyset(&foreign.sa_mask);
        struct sigaction original = {};
        QCOMPARE(sigaction(SIGINT, &foreign, &original), 0);
        QCOMPARE(ShellAndWait(u"sleep 0.6"_qs, 0, 1, 0), 0);
        struct sigaction current = {};
        sigaction(SIGINT, nullptr, &current);
        const bool restored = current.sa_handler == foreignHandler;
        foreignHandlerCalls = 0;
        if (restored)
            ::raise(SIGINT);
        sigaction(SIGINT, &original, nullptr);
        QVERIFY(restored);
        QCOMPARE(int(foreignHandlerCalls), 1);
    }

private:
    QString pidFile() const { return m_env->path(QStringLiteral("pid")); }
    qint64 readPid() const { return ReadFile(pidFile()).trimmed().toLongLong(); }
    QString sleeper(double seconds) const
    {
        return QStringLiteral("sh -c \"echo $$ > '%1'; exec sleep %2\"").arg(pidFile()).arg(seconds);
    }
    void killAndAwaitReaping(qint64 pid)
    {
        QVERIFY(pid > 0);
        ::kill(static_cast<pid_t>(pid), SIGKILL);
        // Nobody but the wait's own reaper can collect it: a lasting zombie would keep /proc/<pid>.
        QTRY_VERIFY_WITH_TIMEOUT(!QFile::exists(QStringLiteral("/proc/%1").arg(pid)), 5000);
    }

    std::unique_ptr<TestEnvironment> m_env;
};

BV_REGISTER_TEST(tst_ShellAndWait);
#include "tst_shellandwait.moc"
