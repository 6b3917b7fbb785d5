#include "gameactions/PackageInstallCommand.h"

#include "gameactions/ServiceCommands.h"
#include "i18n/modLocalizer.h"
#include "support/PathFunctions.h"
#include "support/SystemFolders.h"
#include "support/UserPrompt.h"
#include "support/modShelAndWaitl.h"

namespace Brimvault {

QString InstallCommandLine(const QString& packagePath)
{
    // A double quote inside the path (possible outside Windows) is written the way the command-line splitter
    // reads a literal one.
    QString quoted = packagePath;
    quoted.replace(QStringLiteral("\""), QStringLiteral("\"\"\""));
    return ServiceCommands::InstallPrefix + u' ' + u'"' + quoted + u'"';
}

bool InstallGamePackage(const QString& packagePath)
{
    const int result
        = modShelAndWaitl::ShellAndWait(InstallCommandLine(packagePath), 0, 1, modShelAndWaitl::BreakGiveUp);
    if (result == modShelAndWaitl::WaitEnded)
        return true;
    ShowPrompt({modLocalizer::Translate(1220, QStringLiteral("There was an error! The game isn't installed!")),
        modLocalizer::Translate(1020, QStringLiteral("Brimvault")), PromptIcon::Critical, PromptButtons::Ok});
    return false;
}

QString InstallDialogTitle()
{
    return modLocalizer::Translate(1085, QStringLiteral("Install game...")).remove(QStringLiteral("..."));
}

QString InstallDialogFilter()
{
    return QStringLiteral("BVXPAK ") + modLocalizer::Translate(720, QStringLiteral("files"))
        + QStringLiteral(" (*.bvxpak)|*.bvxpak");
}

QString InstallFolderMemory::dialogFolder()
{
    if (m_lastFolder.isEmpty())
        m_lastFolder = GetSpecialFolder(CSIDL_PERSONAL, QString());
    return m_lastFolder;
}

void InstallFolderMemory::packageChosen(const QString& packagePath)
{
    m_lastFolder = GetFileFolder(packagePath, false);
}

} // namespace Brimvault
