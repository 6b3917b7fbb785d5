#include "app/startup/CommandLine.h"
#include "app/startup/WidgetPrompts.h"
#include "app/startup/modMain.h"
#include "media/MediaHostEntry.h"
#include "media/WebEngineStartup.h"
#include "store/SettingsStore.h"

#include <QApplication>
#include <QWidget>

#include <algorithm>

int main(int argc, char* argv[])
{
    using namespace Brimvault;

    QCoreApplication::setApplicationName(AppTitle());
    QCoreApplication::setApplicationVersion(QStringLiteral(BRIMVAULT_VERSION));
    if (CommandLine::NeedsNoDisplay(argc, argv)) {
        // A command prints and ends: no window system, styles or fonts to load first.
        QCoreApplication app(argc, argv);
        return CommandLine::Dispatch(QCoreApplication::arguments().mid(1)).value_or(CommandLine::UsageExitCode);
    }

    PrepareWebEngine();
    QApplication app(argc, argv);
    QGuiApplication::setDesktopFileName(QStringLiteral("io.brimvault.Brimvault"));
    // Qt's own options come first and are taken out by now; a command may follow them.
    if (const std::optional<int> exitCode = CommandLine::Dispatch(QApplication::arguments().mid(1)))
        return *exitCode;

    InstallWidgetPrompts();
#ifdef Q_OS_WIN
    // A DLL could not share the program's state the way a module does here: Windows links the host in.
    MediaHost::Provide(MediaHostEntryPoints());
#endif
    modMain::Main();

    // Main has shown the main window, or has told the user why it cannot and there is nothing to run.
    const QWidgetList windows = QApplication::topLevelWidgets();
    const bool windowShown
        = std::any_of(windows.cbegin(), windows.cend(), [](const QWidget* window) { return window->isVisible(); });
    return windowShown ? app.exec() : 1;
}
