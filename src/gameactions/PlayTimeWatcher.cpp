#include "gameactions/PlayTimeWatcher.h"

#include "store/PlayHistory.h"

#include <QElapsedTimer>
#include <QTimer>

#include <functional>
#include <memory>
#include <utility>

#ifdef Q_OS_WIN
#include <QWinEventNotifier>
#include <windows.h>
#else
#include <QSocketNotifier>
#include <cerrno>
#include <csignal>
#include <sys/syscall.h>
#include <unistd.h>
#endif

namespace Brimvault {

namespace {

// One watched game: calls done once, from the event loop, when the process has ended.
class ProcessEnd : public QObject {
public:
    ProcessEnd(qint64 pid, std::function<void()> done, QObject* parent)
        : QObject(parent)
        , m_done(std::move(done))
    {
#ifdef Q_OS_WIN
        m_handle = OpenProcess(SYNCHRONIZE, FALSE, DWORD(pid));
        if (m_handle) {
            auto* notifier = new QWinEventNotifier(m_handle, this);
            connect(notifier, &QWinEventNotifier::activated, this, &ProcessEnd::finish);
            return;
        }
#else
#ifdef SYS_pidfd_open
        m_descriptor = int(syscall(SYS_pidfd_open, pid_t(pid), 0));
        if (m_descriptor >= 0) {
            auto* notifier = new QSocketNotifier(m_descriptor, QSocketNotifier::Read, this);
            connect(notifier, &QSocketNotifier::activated, this, &ProcessEnd::finish);
            return;
        }
#endif
        // Without process descriptors: the process is not our child (it was started detached), so ask the
        // kernel whether it still exists, once a second.
        auto* poll = new QTimer(this);
        connect(poll, &QTimer::timeout, this, [this, pid] {
            if (::kill(pid_t(pid), 0) != 0 && errno == ESRCH)
                finish();
        });
        poll->start(1000);
        return;
#endif
        deleteLater();
    }

    ~ProcessEnd() override
    {
#ifdef Q_OS_WIN
        if (m_handle)
            CloseHandle(m_handle);
#else
        if (m_descriptor >= 0)
            ::close(m_descriptor);
#endif
    }

private:
    void finish()
    {
        if (!m_done)
            return;
        const auto done = std::exchange(m_done, {});
        done();
        deleteLater();
    }

    std::function<void()> m_done;
#ifdef Q_OS_WIN
    HANDLE m_handle = nullptr;
#else
    int m_descriptor = -1;
#endif
};

} // namespace

PlayTimeWatcher::PlayTimeWatcher(QObject* parent)
    : QObject(parent)
{ }

void PlayTimeWatcher::watch(qint64 pid, const QString& path)
{
    if (pid <= 0)
        return;
    auto clock = std::make_shared<QElapsedTimer>();
    clock->start();
    new ProcessEnd(
        pid,
        [this, clock, path] {
            const qint64 seconds = (clock->elapsed() + 500) / 1000;
            PlayHistory::AddPlayTime(path, seconds);
            Q_EMIT ended(path, seconds);
        },
        this);
}

} // namespace Brimvault
