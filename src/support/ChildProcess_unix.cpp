#include "support/ChildProcess.h"

#ifndef Q_OS_WIN

#include "support/CommandLine.h"

#include <QDeadlineTimer>
#include <QFile>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <ctime>
#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <vector>

namespace Brimvault {

namespace {

int openPidDescriptor(pid_t pid)
{
#ifdef SYS_pidfd_open
    return static_cast<int>(syscall(SYS_pidfd_open, pid, 0));
#else
    Q_UNUSED(pid);
    return -1;
#endif
}

class SpawnAttributes {
public:
    SpawnAttributes()
    {
        posix_spawnattr_init(&m_attributes);
        // Its own process group: a Ctrl+C typed at our terminal is the user's break of the wait, not
        // the end of the started program.
        posix_spawnattr_setpgroup(&m_attributes, 0);
        sigset_t none;
        sigemptyset(&none);
        posix_spawnattr_setsigmask(&m_attributes, &none);
        sigset_t defaults;
        sigemptyset(&defaults);
        for (int signal : {SIGINT, SIGQUIT, SIGPIPE, SIGTERM, SIGHUP, SIGCHLD})
            sigaddset(&defaults, signal);
        posix_spawnattr_setsigdefault(&m_attributes, &defaults);
        posix_spawnattr_setflags(
            &m_attributes, static_cast<short>(POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF));
    }
    ~SpawnAttributes() { posix_spawnattr_destroy(&m_attributes); }
    SpawnAttributes(const SpawnAttributes&) = delete;
    SpawnAttributes& operator=(const SpawnAttributes&) = delete;
    const posix_spawnattr_t* get() const { return &m_attributes; }

private:
    posix_spawnattr_t m_attributes;
};

// Ended, TimedOut (still running) or Failed, without blocking.
ChildProcess::Wait reapIfEnded(pid_t pid, bool& reaped)
{
    for (;;) {
        const pid_t result = waitpid(pid, nullptr, WNOHANG);
        if (result == pid) {
            reaped = true;
            return ChildProcess::Wait::Ended;
        }
        if (result == 0)
            return ChildProcess::Wait::TimedOut;
        if (errno == EINTR)
            continue;
        // Someone else reaped it (SIGCHLD ignored, a foreign waitpid(-1)): it has ended all the same.
        if (errno == ECHILD) {
            reaped = true;
            return ChildProcess::Wait::Ended;
        }
        return ChildProcess::Wait::Failed;
    }
}

void sleepBriefly(qint64 milliseconds)
{
    const timespec pause {0, static_cast<long>(std::clamp<qint64>(milliseconds, 0, 10)) * 1000 * 1000};
    nanosleep(&pause, nullptr);
}

} // namespace

std::unique_ptr<ChildProcess> ChildProcess::Start(const ResolvedCommand& command, int windowStyle)
{
    Q_UNUSED(windowStyle);
    const QByteArray program = QFile::encodeName(command.program);
    std::vector<QByteArray> words {program};
    for (const QString& argument : command.arguments)
        words.push_back(argument.toLocal8Bit());
    std::vector<char*> argv;
    for (QByteArray& word : words)
        argv.push_back(word.data());
    argv.push_back(nullptr);

    SpawnAttributes attributes;
    // A started program must not read our terminal: from its own process group that would stop it for good.
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    posix_spawn_file_actions_addopen(&files, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
#if defined(__GLIBC__) && __GLIBC_PREREQ(2, 34)
    posix_spawn_file_actions_addclosefrom_np(&files, STDERR_FILENO + 1);
#endif
    pid_t pid = 0;
    const int error = posix_spawn(&pid, program.constData(), &files, attributes.get(), argv.data(), environ);
    posix_spawn_file_actions_destroy(&files);
    if (error != 0 || pid <= 0)
        return nullptr;
    return std::unique_ptr<ChildProcess>(new ChildProcess(pid, openPidDescriptor(pid)));
}

ChildProcess::ChildProcess(qint64 pid, qintptr handle)
    : m_pid(pid)
    , m_handle(handle)
{ }

ChildProcess::~ChildProcess()
{
    if (m_handle >= 0)
        close(static_cast<int>(m_handle));
    if (!m_reaped) {
        const auto pid = static_cast<pid_t>(m_pid);
        std::thread([pid] {
            while (waitpid(pid, nullptr, 0) < 0 && errno == EINTR) { }
        }).detach();
    }
}

ChildProcess::Wait ChildProcess::check()
{
    if (m_reaped)
        return Wait::Ended;
    return reapIfEnded(static_cast<pid_t>(m_pid), m_reaped);
}

ChildProcess::Wait ChildProcess::wait(int milliseconds, const std::function<bool()>& interrupted)
{
    if (m_reaped)
        return Wait::Ended;
    const QDeadlineTimer deadline(milliseconds);
    for (;;) {
        const Wait now = check();
        if (now != Wait::TimedOut)
            return now;
        const qint64 remaining = deadline.remainingTime();
        if (remaining <= 0)
            return Wait::TimedOut;
        if (m_handle >= 0) {
            pollfd descriptor {static_cast<int>(m_handle), POLLIN, 0};
            const int ready = poll(&descriptor, 1, static_cast<int>(remaining));
            if (ready < 0 && errno != EINTR)
                return Wait::Failed;
        } else {
            sleepBriefly(remaining);
        }
        if (interrupted && interrupted())
            return check() == Wait::Ended ? Wait::Ended : Wait::Interrupted;
    }
}

} // namespace Brimvault

#endif
