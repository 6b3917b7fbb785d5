#include "support/modShelAndWaitl.h"

#include "support/ChildProcess.h"
#include "support/CommandLine.h"
#include "support/UserBreak.h"
#include "support/UserPrompt.h"

#include <QCoreApplication>

#include <optional>

namespace Brimvault::modShelAndWaitl {

namespace {

constexpr int pollInterval = 500;

// The store's AppTitle() lies above this library; the title is the same text.
QString applicationTitle()
{
    return QStringLiteral("Brimvault");
}

bool isValidWindowStyle(int windowStyle)
{
    switch (windowStyle) {
    case 0:
    case 1:
    case 2:
    case 3:
    case 4:
    case 6:
        return true;
    default:
        return false;
    }
}

void pumpPendingEvents()
{
    if (QCoreApplication::instance())
        QCoreApplication::processEvents();
}

// The result that ends the wait, or nothing when waiting goes on.
std::optional<int> answerUserBreak(int breakAction)
{
    UserBreakScope::Clear();
    if (breakAction == BreakGiveUp)
        return WaitUserBreak;
    if (breakAction == BreakAsk) {
        PromptRequest question;
        question.text = QStringLiteral("User Process Break.\r\nContinue to wait?");
        question.title = applicationTitle();
        question.icon = PromptIcon::None;
        question.buttons = PromptButtons::YesNo;
        if (ShowPrompt(question) == PromptAnswer::No)
            return WaitUserDeclined;
    }
    return std::nullopt;
}

int waitForEnd(ChildProcess& process, int timeoutMs, int breakAction)
{
    const auto breakPending = [] { return UserBreakScope::Pending(); };
    qint64 elapsed = 0;
    ChildProcess::Wait outcome = process.wait(pollInterval, breakPending);
    for (;;) {
        if (outcome == ChildProcess::Wait::Interrupted) {
            if (const auto result = answerUserBreak(breakAction))
                return *result;
            // Ignoring the break repeats the interrupted wait; a "continue" carries on after it.
            outcome = breakAction == BreakIgnore ? process.wait(pollInterval, breakPending) : process.check();
            continue;
        }
        if (outcome == ChildProcess::Wait::Ended)
            return WaitEnded;

        pumpPendingEvents();
        if (UserBreakScope::Pending()) {
            if (const auto result = answerUserBreak(breakAction))
                return *result;
        }

        switch (outcome) {
        case ChildProcess::Wait::Abandoned:
            return WaitAbandoned;
        case ChildProcess::Wait::TimedOut:
            elapsed += pollInterval;
            if (timeoutMs > 0 && elapsed > timeoutMs)
                return WaitTimedOut;
            outcome = process.wait(pollInterval, breakPending);
            break;
        default:
            return WaitFailed;
        }
    }
}

} // namespace

int ShellAndWait(const QString& commandLine, int timeoutMs, int windowStyle, int breakAction)
{
    if (commandLine.trimmed().isEmpty())
        return WaitInvalidArgument;
    if (timeoutMs < 0)
        return WaitInvalidArgument;
    if (breakAction != BreakIgnore && breakAction != BreakGiveUp && breakAction != BreakAsk)
        return WaitInvalidArgument;
    if (!isValidWindowStyle(windowStyle))
        return WaitInvalidArgument;

    const std::optional<ResolvedCommand> command = ResolveCommandLine(commandLine);
    if (!command)
        return WaitFailed;
    const std::unique_ptr<ChildProcess> process = ChildProcess::Start(*command, windowStyle);
    if (!process)
        return WaitFailed;

    const UserBreakScope breakScope;
    return waitForEnd(*process, timeoutMs, breakAction);
}

void RequestUserBreak()
{
    UserBreakScope::Raise();
}

} // namespace Brimvault::modShelAndWaitl
