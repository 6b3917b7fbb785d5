#pragma once

namespace Brimvault {

// The user's break of a running wait. While at least one scope lives, SIGINT (Ctrl+C at the terminal)
// raises the break instead of ending the program; the old handler returns with the last scope.
// modShelAndWaitl::RequestUserBreak raises it from the program itself.
class UserBreakScope {
public:
    UserBreakScope();
    ~UserBreakScope();
    UserBreakScope(const UserBreakScope&) = delete;
    UserBreakScope& operator=(const UserBreakScope&) = delete;

    static bool Pending();
    static void Clear();
    static void Raise();
};

} // namespace Brimvault
