#include "GameInstaller.h"
#include "InstallFeedback.h"
#include "PackageWriter.h"
#include "ServiceCommandLine.h"
#include "StagingArea.h"

#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QApplication>
#include <QCoreApplication>
#include <QGuiApplication>

#include <memory>

using namespace Brimvault;

namespace {

enum ExitCode { Succeeded = 0, Failed = 1, BadCommandLine = 2 };

int install(const QString& package, InstallFeedback& feedback)
{
    const InstallResult result = InstallPackage(
        package, [&](qint64 done, qint64 total) { return feedback.progress(done, total); },
        [&](InstallPhase phase, const QString& gameFolder) { feedback.phase(phase, gameFolder); });
    if (result.cancelled) {
        PrintToStandardError(result.problem);
        return Failed;
    }
    if (!result.succeeded()) {
        feedback.failed(result.problem);
        return Failed;
    }
    return Succeeded;
}

// Both run hidden at times the user does not choose, so they say nothing and never fail the caller.
int tidy()
{
    TidyStagingArea(DataFolders::GamesFolder());
    return Succeeded;
}

} // namespace

int main(int argc, char* argv[])
{
    QStringList arguments;
    for (int i = 1; i < argc; ++i)
        arguments.append(QString::fromLocal8Bit(argv[i]));
    const ServiceCommand command = ParseServiceCommandLine(arguments);

    if (command.kind == ServiceCommand::Kind::Install && DisplayAvailable()) {
        PreferOffscreenFallback();
        QApplication app(argc, argv);
        app.setApplicationName(AppTitle());
        app.setQuitOnLastWindowClosed(false);
        // A display that was announced but cannot be reached leaves us on the fallback platform.
        const bool windows = QGuiApplication::platformName() != u"offscreen";
        const auto feedback = windows ? MakeWindowFeedback() : MakeConsoleFeedback();
        return install(command.package, *feedback);
    }

    QCoreApplication app(argc, argv);
    app.setApplicationName(AppTitle());
    switch (command.kind) {
    case ServiceCommand::Kind::Install:
        return install(command.package, *MakeConsoleFeedback());
    case ServiceCommand::Kind::Tidy:
    case ServiceCommand::Kind::AfterLaunch:
        return tidy();
    case ServiceCommand::Kind::Pack:
        if (const QString problem = PackGameFolder(command.gameFolder, command.package); !problem.isEmpty()) {
            PrintToStandardError(QStringLiteral("The package was not built: %1").arg(problem));
            return Failed;
        }
        return Succeeded;
    case ServiceCommand::Kind::Usage:
        break;
    }
    PrintToStandardError(ServiceUsage());
    return BadCommandLine;
}
