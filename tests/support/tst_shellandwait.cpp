#include "support/UserPrompt.h"
#include "support/modShelAndWaitl.h"

#include "TestEnvironment.h"

#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QTest>
#include <QTimer>

#include <csignal>
#include <fcntl.h>
#include <signal.h>
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

class DeliveryFlag : public QObject {
public:
    bool delivered = false;

protected:
    bool event(QEvent* event) override
    {
        if (event->type() != QEvent::User)
            return QObject::event(event);
        delivered = true;
        return true;
    }
};

bool processIsAlive(qint64 pid)
{
    QFile stat(QStringLiteral("/proc/%1/stat").arg(pid));
    if (!stat.open(QIODevice::ReadOnly))
        return false;
    const QByteArray text = stat.readAll();
    const qsizetype afterName = text.lastIndexOf(')');
    return afterName > 0 && text.size() > afterName + 2 && text.at(afterName + 2) != 'Z';
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
    void init();
    void cleanup();
    void invalidArguments_data();
    void invalidArguments();
    void validWindowStyles_data();
    void validWindowStyles();
    void startFailure_data();
    void startFailure();
    void exitCodeIsNotTheResult_data();
    void exitCodeIsNotTheResult();
    void timeOutCountsPolls_data();
    void timeOutCountsPolls();
    void noLimitWaitsForTheEnd();
    void quickProcessPumpsNothing();
    void startedProgramReadsNothingFromUs();
    void startedProgramGetsNoneOfOurFiles();
    void endedProcessLeavesNoZombie();
    void processSurvivesTimeOut();
    void userBreak_data();
    void userBreak();
    void breakOutsideAWaitIsForgotten();
    void interruptHandlerIsRestored();

private:
    QString pidFile() const { return m_env->path(QStringLiteral("pid")); }
    qint64 readPid() const;
    void killAndAwaitReaping(qint64 pid);

    std::unique_ptr<TestEnvironment> m_env;
    QList<PromptRequest> m_prompts;
    PromptAnswer m_answer = PromptAnswer::Yes;
};

qint64 tst_ShellAndWait::readPid() const
{
    QFile file(pidFile());
    if (!file.open(QIODevice::ReadOnly))
        return 0;
    return file.readAll().trimmed().toLongLong();
}

void tst_ShellAndWait::killAndAwaitReaping(qint64 pid)
{
    QVERIFY(pid > 0);
    ::kill(static_cast<pid_t>(pid), SIGKILL);
    // Nobody but the wait's own reaper can collect it: a lasting zombie would keep /proc/<pid>.
    QTRY_VERIFY_WITH_TIMEOUT(!QFile::exists(QStringLiteral("/proc/%1").arg(pid)), 5000);
}

void tst_ShellAndWait::init()
{
    m_env = std::make_unique<TestEnvironment>();
    m_prompts.clear();
    SetPromptHandler([this](const PromptRequest& request) {
        m_prompts.append(request);
        return m_answer;
    });
}

void tst_ShellAndWait::cleanup()
{
    SetPromptHandler({});
    m_env.reset();
}

void tst_ShellAndWait::invalidArguments_data()
{
    QTest::addColumn<QString>("commandLine");
    QTest::addColumn<int>("timeoutMs");
    QTest::addColumn<int>("windowStyle");
    QTest::addColumn<int>("breakAction");

    const QString starts = QStringLiteral("sh -c \"echo $$ > '%1'\"");
    QTest::newRow("blanks") << u"   "_qs << 0 << 1 << 0;
    QTest::newRow("empty") << QString() << 0 << 1 << 0;
    QTest::newRow("negative time-out") << starts << -1 << 1 << 0;
    QTest::newRow("window style 5") << starts << 0 << 5 << 0;
    QTest::newRow("window style 7") << starts << 0 << 7 << 0;
    QTest::newRow("window style -1") << starts << 0 << -1 << 0;
    QTest::newRow("break action 3") << starts << 0 << 1 << 3;
    QTest::newRow("break action -1") << starts << 0 << 1 << -1;
}

void tst_ShellAndWait::invalidArguments()
{
    QFETCH(QString, commandLine);
    QFETCH(int, timeoutMs);
    QFETCH(int, windowStyle);
    QFETCH(int, breakAction);

    QCOMPARE(ShellAndWait(commandLine.arg(pidFile()), timeoutMs, windowStyle, breakAction), WaitInvalidArgument);
    QTest::qSleep(100);
    QVERIFY2(!QFile::exists(pidFile()), "nothing may be started");
}

void tst_ShellAndWait::validWindowStyles_data()
{
    QTest::addColumn<int>("windowStyle");
    for (int style : {0, 1, 2, 3, 4, 6})
        QTest::addRow("style %d", style) << style;
}

void tst_ShellAndWait::validWindowStyles()
{
    QFETCH(int, windowStyle);
    QCOMPARE(ShellAndWait(QStringLiteral("sh -c \"echo $$ > '%1'\"").arg(pidFile()), 0, windowStyle, 0), WaitEnded);
    QVERIFY(readPid() > 0);
}

void tst_ShellAndWait::startFailure_data()
{
    QTest::addColumn<QString>("commandLine");

    QTest::newRow("unknown program") << u"no-such-program-brimvault --flag"_qs;
    QTest::newRow("missing path") << u"/nonexistent/folder/game.exe"_qs;
    QTest::newRow("not executable") << u"{notexec}"_qs;
    QTest::newRow("empty quotes") << u"\"\""_qs;
}

void tst_ShellAndWait::startFailure()
{
    QFETCH(QString, commandLine);
    const QString notExecutable = m_env->path(u"readme.txt"_qs);
    QFile file(notExecutable);
    QVERIFY(file.open(QIODevice::WriteOnly));
    file.write("echo hello\n");
    file.close();

    QCOMPARE(ShellAndWait(commandLine.replace(u"{notexec}"_qs, notExecutable), 0, 1, 0), WaitFailed);
}

void tst_ShellAndWait::exitCodeIsNotTheResult_data()
{
    QTest::addColumn<QString>("commandLine");
    QTest::newRow("true") << u"true"_qs;
    QTest::newRow("false") << u"false"_qs;
    QTest::newRow("exit 3") << u"sh -c \"exit 3\""_qs;
}

void tst_ShellAndWait::exitCodeIsNotTheResult()
{
    QFETCH(QString, commandLine);
    QCOMPARE(ShellAndWait(commandLine, 0, 0, 0), WaitEnded);
}

void tst_ShellAndWait::timeOutCountsPolls_data()
{
    QTest::addColumn<int>("timeoutMs");
    QTest::addColumn<int>("polls");

    QTest::newRow("1 ms: after the first wait") << 1 << 1;
    QTest::newRow("499 ms: after the first wait") << 499 << 1;
    QTest::newRow("500 ms: after the second wait") << 500 << 2;
    QTest::newRow("1000 ms: after the third wait") << 1000 << 3;
}

void tst_ShellAndWait::timeOutCountsPolls()
{
    QFETCH(int, timeoutMs);
    QFETCH(int, polls);

    PumpCounter counter;
    QElapsedTimer clock;
    clock.start();
    QCOMPARE(ShellAndWait(QStringLiteral("sh -c \"echo $$ > '%1'; exec sleep 20\"").arg(pidFile()), timeoutMs, 0, 0),
        WaitTimedOut);
    const qint64 elapsed = clock.elapsed();
    QCOMPARE(counter.rounds, polls);
    QVERIFY2(elapsed >= polls * 500 - 50, qPrintable(QString::number(elapsed)));
    killAndAwaitReaping(readPid());
}

void tst_ShellAndWait::noLimitWaitsForTheEnd()
{
    PumpCounter counter;
    QCOMPARE(ShellAndWait(u"sleep 1.2"_qs, 0, 1, 0), WaitEnded);
    QCOMPARE(counter.rounds, 2);
}

void tst_ShellAndWait::quickProcessPumpsNothing()
{
    DeliveryFlag target;
    QCoreApplication::postEvent(&target, new QEvent(QEvent::User));
    QCOMPARE(ShellAndWait(u"true"_qs, 0, 1, 0), WaitEnded);
    QVERIFY(!target.delivered);
    QCoreApplication::processEvents();
    QVERIFY(target.delivered);
}

void tst_ShellAndWait::startedProgramReadsNothingFromUs()
{
    // Our input is a pipe that never ends; a program reading its input must still see an end at once.
    int pipeEnds[2];
    QCOMPARE(::pipe2(pipeEnds, O_CLOEXEC), 0);
    const int savedInput = ::dup(STDIN_FILENO);
    ::dup2(pipeEnds[0], STDIN_FILENO);
    const int result = ShellAndWait(QStringLiteral("sh -c \"cat > '%1'\"").arg(pidFile()), 3000, 0, 0);
    ::dup2(savedInput, STDIN_FILENO);
    for (int descriptor : {savedInput, pipeEnds[0], pipeEnds[1]})
        ::close(descriptor);

    QCOMPARE(result, WaitEnded);
    QVERIFY(QFile::exists(pidFile()));
}

void tst_ShellAndWait::startedProgramGetsNoneOfOurFiles()
{
    int pipeEnds[2];
    QCOMPARE(::pipe(pipeEnds), 0);
    const QString probe = QStringLiteral("sh -c \"[ -e /proc/self/fd/%1 ] && echo inherited > '%2'\"");
    const int result = ShellAndWait(probe.arg(pipeEnds[1]).arg(pidFile()), 3000, 0, 0);
    ::close(pipeEnds[0]);
    ::close(pipeEnds[1]);
    QCOMPARE(result, WaitEnded);
    QVERIFY(!QFile::exists(pidFile()));
}

void tst_ShellAndWait::endedProcessLeavesNoZombie()
{
    QCOMPARE(ShellAndWait(QStringLiteral("sh -c \"echo $$ > '%1'\"").arg(pidFile()), 0, 0, 0), WaitEnded);
    const qint64 pid = readPid();
    QVERIFY(pid > 0);
    QVERIFY(!QFile::exists(QStringLiteral("/proc/%1").arg(pid)));
}

void tst_ShellAndWait::processSurvivesTimeOut()
{
    QCOMPARE(
        ShellAndWait(QStringLiteral("sh -c \"echo $$ > '%1'; exec sleep 20\"").arg(pidFile()), 1, 0, 1), WaitTimedOut);
    const qint64 pid = readPid();
    QVERIFY(pid > 0);
    QTest::qSleep(200);
    QVERIFY(processIsAlive(pid));
    killAndAwaitReaping(pid);
}

void tst_ShellAndWait::userBreak_data()
{
    QTest::addColumn<bool>("bySignal");
    QTest::addColumn<int>("breakAction");
    QTest::addColumn<PromptAnswer>("answer");
    QTest::addColumn<int>("expected");
    QTest::addColumn<bool>("asked");

    for (bool bySignal : {false, true}) {
        const char* via = bySignal ? "SIGINT" : "request";
        QTest::addRow("%s, ignore", via) << bySignal << 0 << PromptAnswer::Yes << 0 << false;
        QTest::addRow("%s, give up", via) << bySignal << 1 << PromptAnswer::Yes << 5 << false;
        QTest::addRow("%s, ask, Yes", via) << bySignal << 2 << PromptAnswer::Yes << 0 << true;
        QTest::addRow("%s, ask, No", via) << bySignal << 2 << PromptAnswer::No << 6 << true;
    }
}

void tst_ShellAndWait::userBreak()
{
    QFETCH(bool, bySignal);
    QFETCH(int, breakAction);
    QFETCH(PromptAnswer, answer);
    QFETCH(int, expected);
    QFETCH(bool, asked);
    m_answer = answer;

    // A signal arrives during the first wait; a request comes from an event handled at the first pump.
    std::thread interrupter;
    if (bySignal) {
        // Only once the program runs is the wait (and its handler) certainly in place.
        const QByteArray started = QFile::encodeName(pidFile());
        interrupter = std::thread([started] {
            for (int tries = 0; tries < 500 && ::access(started.constData(), F_OK) != 0; ++tries)
                std::this_thread::sleep_for(std::chrono::milliseconds(5));
            std::this_thread::sleep_for(std::chrono::milliseconds(100));
            ::kill(::getpid(), SIGINT);
        });
    } else {
        QTimer::singleShot(0, this, [] { RequestUserBreak(); });
    }
    const int result
        = ShellAndWait(QStringLiteral("sh -c \"echo $$ > '%1'; exec sleep 1.2\"").arg(pidFile()), 0, 1, breakAction);
    if (interrupter.joinable())
        interrupter.join();
    const qint64 pid = readPid();
    QCOMPARE(result, expected);

    QCOMPARE(m_prompts.size(), asked ? 1 : 0);
    if (asked) {
        const PromptRequest& question = m_prompts.first();
        QCOMPARE(question.text, u"User Process Break.\r\nContinue to wait?"_qs);
        QCOMPARE(question.title, u"Brimvault"_qs);
        QCOMPARE(question.buttons, PromptButtons::YesNo);
        QCOMPARE(question.icon, PromptIcon::None);
    }
    if (expected == WaitEnded) {
        QVERIFY(!QFile::exists(QStringLiteral("/proc/%1").arg(pid)));
    } else {
        // Only the wait ends; the process goes on.
        QVERIFY(processIsAlive(pid));
        killAndAwaitReaping(pid);
    }
}

void tst_ShellAndWait::breakOutsideAWaitIsForgotten()
{
    RequestUserBreak();
    QCOMPARE(ShellAndWait(u"sleep 0.7"_qs, 0, 1, BreakGiveUp), WaitEnded);
}

void tst_ShellAndWait::interruptHandlerIsRestored()
{
    struct sigaction foreign = {};
    foreign.sa_handler = foreignHandler;
    sigemptyset(&foreign.sa_mask);
    struct sigaction original = {};
    QCOMPARE(sigaction(SIGINT, &foreign, &original), 0);

    QCOMPARE(ShellAndWait(u"sleep 0.6"_qs, 0, 1, 0), WaitEnded);

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

QTEST_GUILESS_MAIN(tst_ShellAndWait)
#include "tst_shellandwait.moc"
