#pragma once

#include <QtGlobal>
#include <functional>
#include <memory>

namespace Brimvault {

struct ResolvedCommand;

// One started process as the waiting code sees it: a pid and a handle to wait on. Letting go of the object
// never ends the process; elsewhere than on Windows a process still running is reaped in the background
// when it ends, so that no zombie stays behind.
class ChildProcess {
public:
    enum class Wait { Ended, TimedOut, Interrupted, Abandoned, Failed };

    // Null when the process cannot be started, or on Windows when its handle cannot be opened (elsewhere
    // a kernel without process descriptors is polled instead). The window style is the show-window value
    // of Windows; console programs elsewhere have nothing to show or hide, and read nothing from us.
    static std::unique_ptr<ChildProcess> Start(const ResolvedCommand& command, int windowStyle);

    ~ChildProcess();
    ChildProcess(const ChildProcess&) = delete;
    ChildProcess& operator=(const ChildProcess&) = delete;

    qint64 pid() const { return m_pid; }

    // Waits up to milliseconds for the end. A signal that cuts the wait short ends it as Interrupted only
    // when interrupted() says so; otherwise the wait goes on for the rest of the time.
    Wait wait(int milliseconds, const std::function<bool()>& interrupted);

    // Ended or TimedOut (still running) at once, without waiting.
    Wait check();

private:
    ChildProcess(qint64 pid, qintptr handle);

    qint64 m_pid = 0;
    qintptr m_handle = -1;
    bool m_reaped = false;
};

} // namespace Brimvault
