#pragma once

#include <QList>
#include <QString>
#include <QStringList>

#include <functional>
#include <optional>

// The options the program answers without showing a window.
namespace Brimvault::CommandLine {

inline constexpr int UsageExitCode = 2;

struct Command {
    QString option; // "--version-info"
    QString argumentsHelp; // "FILE", shown in the usage
    QString description;
    int minArguments = 0;
    int maxArguments = 0;
    // Gets the arguments after the option; returns the process's exit code.
    std::function<int(const QStringList& arguments)> run;
};

// Every command, in the order the usage lists them (CommandTable.cpp).
QList<Command> Commands();

QString Usage();

// Runs the command named by the first argument (the program name left out). Nothing when there are no
// arguments: the caller starts the window. Unknown options and wrong argument counts print the usage to
// standard error and give UsageExitCode.
std::optional<int> Dispatch(const QStringList& arguments);

// True when the raw command line starts with an argument that is not one of Qt's own options: a command
// or a mistake, neither of which needs a display. The caller picks the offscreen platform before the
// application object exists, so that both work where no display is reachable.
bool NeedsNoDisplay(int argc, const char* const* argv);

} // namespace Brimvault::CommandLine
