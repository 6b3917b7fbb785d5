// The commands of the program's command line. A new command adds one entry here and its function in its
// own subsystem.
#include "app/startup/CommandLine.h"

#include "catalogue/CatalogueListing.h"
#include "icons/IconCommands.h"
#include "store/SettingsStore.h"

#include <QTextStream>

namespace Brimvault::CommandLine {

namespace {

int printUsage(const QStringList&)
{
    QTextStream(stdout) << Usage();
    return 0;
}

int printVersion(const QStringList&)
{
    QTextStream(stdout) << AppTitle() << ' ' << QStringLiteral(BRIMVAULT_VERSION) << '\n';
    return 0;
}

int extractIcon(const QStringList& arguments)
{
    QTextStream err(stderr);
    return IconCommands::ExtractIcon(arguments.at(0), arguments.at(1), err);
}

int versionInfo(const QStringList& arguments)
{
    QTextStream out(stdout);
    QTextStream err(stderr);
    return IconCommands::PrintVersionInfo(arguments.at(0), out, err);
}

int listCatalogue(const QStringList& arguments)
{
    CatalogueListing::ListingOptions options;
    const auto refuse = [](const QString& problem) {
        QTextStream(stderr) << problem << '\n' << Usage();
        return UsageExitCode;
    };
    QStringList seen;
    for (qsizetype i = 0; i < arguments.size(); ++i) {
        const QString& argument = arguments.at(i);
        if (seen.contains(argument))
            return refuse(QStringLiteral("Given twice: ") + argument);
        seen.append(argument);
        if (argument == QLatin1String("--json")) {
            options.format = CatalogueListing::Format::Json;
        } else if (argument == QLatin1String("--find") || argument == QLatin1String("--order")) {
            if (i + 1 >= arguments.size())
                return refuse(QStringLiteral("Missing value for ") + argument);
            const QString value = arguments.at(++i);
            if (argument == QLatin1String("--find")) {
                options.find = value;
            } else if (!(options.order = ListOrders::FromName(value))) {
                return refuse(QStringLiteral("Unknown order: ") + value);
            }
        } else {
            return refuse(QStringLiteral("Unknown argument for --list: ") + argument);
        }
    }
    QTextStream out(stdout);
    return CatalogueListing::PrintCatalogue(options, out);
}

} // namespace

QList<Command> Commands()
{
    return {
        {QStringLiteral("--help"), QString(), QStringLiteral("show this help"), 0, 0, printUsage},
        {QStringLiteral("--version"), QString(), QStringLiteral("show the program's version"), 0, 0, printVersion},
        {QStringLiteral("--extract-icon"), QStringLiteral("FILE OUT.ico"),
            QStringLiteral("write the main icon of an executable as an icon file"), 2, 2, extractIcon},
        {QStringLiteral("--version-info"), QStringLiteral("FILE"),
            QStringLiteral("print the version information of an executable"), 1, 1, versionInfo},
        {QStringLiteral("--list"), QStringLiteral("[--json] [--find TEXT] [--order found|name|recent]"),
            QStringLiteral("print the games as the window lists them, without writing anything"), 0, 5, listCatalogue},
    };
}

} // namespace Brimvault::CommandLine
