#include "support/ChildProcess.h"

#ifdef Q_OS_WIN

#include "support/CommandLine.h"

#include <QProcess>
#include <qt_windows.h>

namespace Brimvault {

std::unique_ptr<ChildProcess> ChildProcess::Start(const ResolvedCommand& command, int windowStyle)
{
    QProcess process;
    process.setProgram(command.program);
    process.setArguments(command.arguments);
    process.setCreateProcessArgumentsModifier([windowStyle](QProcess::CreateProcessArguments* arguments) {
        arguments->startupInfo->dwFlags |= STARTF_USESHOWWINDOW;
        arguments->startupInfo->wShowWindow = static_cast<WORD>(windowStyle);
    });
    qint64 pid = 0;
    if (!process.startDetached(&pid) || pid == 0)
        return nullptr;
    const HANDLE handle = OpenProcess(SYNCHRONIZE, FALSE, static_cast<DWORD>(pid));
    if (!handle)
        return nullptr;
    return std::unique_ptr<ChildProcess>(new ChildProcess(pid, reinterpret_cast<qintptr>(handle)));
}

ChildProcess::ChildProcess(qint64 pid, qintptr handle)
    : m_pid(pid)
    , m_handle(handle)
{ }

ChildProcess::~ChildProcess()
{
    CloseHandle(reinterpret_cast<HANDLE>(m_handle));
}

ChildProcess::Wait ChildProcess::check()
{
    return wait(0, {});
}

ChildProcess::Wait ChildProcess::wait(int milliseconds, const std::function<bool()>&)
{
    switch (WaitForSingleObject(reinterpret_cast<HANDLE>(m_handle), static_cast<DWORD>(milliseconds))) {
    case WAIT_OBJECT_0:
        return Wait::Ended;
    case WAIT_ABANDONED:
        return Wait::Abandoned;
    case WAIT_TIMEOUT:
        return Wait::TimedOut;
    default:
        return Wait::Failed;
    }
}

} // namespace Brimvault

#endif
