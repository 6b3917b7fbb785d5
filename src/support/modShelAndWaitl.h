#pragma once

#include <QString>

namespace Brimvault::modShelAndWaitl {

// Results of ShellAndWait.
enum WaitResult : int {
    WaitEnded = 0,
    WaitFailed = 1,
    WaitTimedOut = 2,
    WaitInvalidArgument = 3,
    WaitAbandoned = 4, // only Windows reports an abandoned wait
    WaitUserBreak = 5,
    WaitUserDeclined = 6,
};

// What a user break during the wait does.
enum BreakAction : int {
    BreakIgnore = 0,
    BreakGiveUp = 1,
    BreakAsk = 2,
};

// Starts commandLine (as typed at a prompt, see ResolveCommandLine) and waits for the process to end,
// polling every 500 ms and handling pending events between polls, so the caller's windows stay live and
// commands may re-enter. timeoutMs 0 waits without limit; the limit counts polls, not the clock, and is
// passed only when the count exceeds it. The process is never ended here: after a time-out or a break it
// keeps running. windowStyle is the show-window value (0, 1, 2, 3, 4 or 6); elsewhere than on Windows it is
// checked and otherwise has no effect.
//
// A user break is SIGINT delivered while the wait runs, or RequestUserBreak(). BreakAsk puts
// "User Process Break." / "Continue to wait?" to the user through the prompt seam.
int ShellAndWait(const QString& commandLine, int timeoutMs, int windowStyle, int breakAction);

// Raises a user break for the wait in progress (for example the Escape key in a progress window);
// ignored when no wait runs.
void RequestUserBreak();

} // namespace Brimvault::modShelAndWaitl
