#include "app/startup/modMain.h"

#include "app/CompanionComponents.h"
#include "app/ComponentObjects.h"
#include "store/SettingsStore.h"
#include "support/ProgramFolder.h"
#include "support/UserPrompt.h"

#include <QFileInfo>
#include <QLibrary>

#include <optional>

namespace Brimvault::modMain {

namespace {

QString settingsSection()
{
    return QStringLiteral("Settings");
}

QString versionKey(const QString& prefix)
{
    return prefix + QStringLiteral("Version");
}

// The version object's GetVersion as text; nothing when the call fails or gives no text.
std::optional<QString> versionText(QObject* versionObject)
{
    const CallOutcome outcome = CallByName(versionObject, QStringLiteral("GetVersion"));
    if (!outcome.ok || !outcome.value.canConvert<QString>())
        return std::nullopt;
    return outcome.value.toString();
}

// Loaded as the system loads a library by bare name: the program's own folder first, then the
// ordinary search path. Never unloaded.
RegisterServerFunction loadRegisterServer(const QString& fileName)
{
    const QString besideProgram = ProgramFolder() + u'/' + fileName;
    QLibrary library(QFileInfo(besideProgram).isFile() ? besideProgram : fileName);
    if (!library.load())
        throw ComponentFileError(library.errorString().toStdString());
    auto registerServer = reinterpret_cast<RegisterServerFunction>(library.resolve(RegisterServerSymbol));
    if (!registerServer)
        throw ComponentFileError(fileName.toStdString() + " has no " + RegisterServerSymbol);
    return registerServer;
}

} // namespace

std::int32_t RegisterComponent(const QString& prefix)
{
    const QString fileName = CompanionComponentFile(prefix);
    if (fileName.isEmpty())
        return 0;
    return loadRegisterServer(fileName)();
}

void ShowAdminMessage()
{
    ShowPrompt({QStringLiteral("You need to run the program as administrator!"), AppTitle(), PromptIcon::Critical,
        PromptButtons::Ok});
}

bool CheckComponent(const QString& prefix)
{
    const QString progId = prefix + QStringLiteral(".clsVersion");
    const QString savedVersion = GetSetting(AppTitle(), settingsSection(), versionKey(prefix));
    bool errorPending = false;

    CreatedObject created = CreateObject(progId);
    if (!created) {
        std::int32_t status = 0;
        try {
            status = RegisterComponent(prefix);
        } catch (...) {
            status = -1;
        }
        if (status != 0) {
            ShowAdminMessage();
            return false;
        }
        created = CreateObject(progId);
        if (!created) {
            errorPending = true;
        } else if (const auto version = versionText(created.object.get())) {
            errorPending = !SaveSetting(AppTitle(), settingsSection(), versionKey(prefix), *version);
        } else {
            errorPending = true;
        }
    } else if (const auto version = versionText(created.object.get())) {
        // Any difference counts, letter case included; versions are never compared as numbers.
        if (*version != savedVersion)
            errorPending = !SaveSetting(AppTitle(), settingsSection(), versionKey(prefix), *version);
    } else {
        errorPending = true;
    }

    if (errorPending) {
        ShowAdminMessage();
        return false;
    }
    return true;
}

} // namespace Brimvault::modMain
