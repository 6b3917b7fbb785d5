#include "app/startup/CommandLine.h"

#include <QTextStream>

#include <cstdio>

namespace Brimvault::CommandLine {

namespace {

const Command* findCommand(const QList<Command>& commands, const QString& option)
{
    for (const Command& command : commands) {
        if (command.option == option)
            return &command;
    }
    return nullptr;
}

int usageError(const QString& problem)
{
    QTextStream err(stderr);
    err << problem << '\n' << Usage();
    return UsageExitCode;
}

} // namespace

QString Usage()
{
    QString text = QStringLiteral("Usage: brimvault [OPTION [ARGUMENTS]]\n"
                                  "Without an option the program starts its window.\n\n");
    // Descriptions line up after the short synopses; a longer synopsis has its description on the next line.
    constexpr qsizetype longestInline = 30;
    const QList<Command> commands = Commands();
    const auto synopsisOf = [](const Command& command) -> QString {
        return command.argumentsHelp.isEmpty() ? command.option : command.option + u' ' + command.argumentsHelp;
    };
    qsizetype width = 0;
    for (const Command& command : commands) {
        if (const qsizetype size = synopsisOf(command).size(); size <= longestInline)
            width = std::max(width, size);
    }
    for (const Command& command : commands) {
        const QString synopsis = synopsisOf(command);
        if (synopsis.size() <= longestInline)
            text += QStringLiteral("  ") + synopsis.leftJustified(width + 2);
        else
            text += QStringLiteral("  ") + synopsis + u'\n' + QString(width + 4, u' ');
        text += command.description + u'\n';
    }
    return text;
}

std::optional<int> Dispatch(const QStringList& arguments)
{
    if (arguments.isEmpty())
        return std::nullopt;
    const QList<Command> commands = Commands();
    const Command* command = findCommand(commands, arguments.first());
    if (!command)
        return usageError(QStringLiteral("Unknown option: ") + arguments.first());
    const QStringList rest = arguments.mid(1);
    if (rest.size() < command->minArguments || rest.size() > command->maxArguments)
        return usageError(QStringLiteral("Wrong number of arguments for ") + command->option);
    return command->run(rest);
}

bool NeedsNoDisplay(int argc, const char* const* argv)
{
    if (argc < 2 || !argv[1])
        return false;
    const QString first = QString::fromLocal8Bit(argv[1]);
    if (findCommand(Commands(), first))
        return true;
    // Qt takes its own options with one dash or two; those still start the window.
    static const QStringList qtOptions = {QStringLiteral("platform"), QStringLiteral("platformpluginpath"),
        QStringLiteral("platformtheme"), QStringLiteral("plugin"), QStringLiteral("qwindowgeometry"),
        QStringLiteral("qwindowicon"), QStringLiteral("qwindowtitle"), QStringLiteral("reverse"),
        QStringLiteral("session"), QStringLiteral("style"), QStringLiteral("stylesheet"), QStringLiteral("widgetcount"),
        QStringLiteral("display"), QStringLiteral("geometry"), QStringLiteral("qmljsdebugger"),
        QStringLiteral("nograb"), QStringLiteral("dograb"), QStringLiteral("sync"), QStringLiteral("name"),
        QStringLiteral("title"), QStringLiteral("visual")};
    const qsizetype dashes = first.startsWith(QStringLiteral("--")) ? 2 : first.startsWith(u'-') ? 1 : 0;
    return dashes == 0 || !qtOptions.contains(first.mid(dashes).section(u'=', 0, 0));
}

} // namespace Brimvault::CommandLine
