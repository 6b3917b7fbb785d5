#include "support/UserBreak.h"

#include <QtGlobal>

#include <atomic>

#ifndef Q_OS_WIN
#include <signal.h>
#endif

namespace Brimvault {

namespace {

std::atomic<bool> breakRaised {false};
static_assert(std::atomic<bool>::is_always_lock_free, "the flag is set from a signal handler");

int openScopes = 0;

#ifndef Q_OS_WIN
struct sigaction previousInterruptAction;

void onInterrupt(int)
{
    breakRaised.store(true);
}

void installInterruptHandler()
{
    struct sigaction action = {};
    action.sa_handler = onInterrupt;
    sigemptyset(&action.sa_mask);
    // No SA_RESTART: the signal must cut the running wait short.
    action.sa_flags = 0;
    sigaction(SIGINT, &action, &previousInterruptAction);
}

void restoreInterruptHandler()
{
    sigaction(SIGINT, &previousInterruptAction, nullptr);
}
#else
void installInterruptHandler() { }
void restoreInterruptHandler() { }
#endif

} // namespace

UserBreakScope::UserBreakScope()
{
    if (openScopes++ == 0)
        installInterruptHandler();
    Clear();
}

UserBreakScope::~UserBreakScope()
{
    if (--openScopes == 0) {
        restoreInterruptHandler();
        Clear();
    }
}

bool UserBreakScope::Pending()
{
    return breakRaised.load();
}

void UserBreakScope::Clear()
{
    breakRaised.store(false);
}

void UserBreakScope::Raise()
{
    if (openScopes > 0)
        breakRaised.store(true);
}

} // namespace Brimvault
