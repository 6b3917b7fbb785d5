#include "app/startup/modMain.h"

#include "app/CompanionComponents.h"
#include "app/ComponentObjects.h"
#include "app/ComponentRegistry.h"
#include "app/LibraryFileCheck.h"
#include "store/SettingsStore.h"
#include "support/ProgramFolder.h"
#include "support/UserPrompt.h"

#include <QFileInfo>
#include <QLibrary>

#include <cstdio>
#include <exception>
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
    if (QFileInfo(besideProgram).isFile()) {
        if (const std::optional<QString> problem = LibraryFileProblem(besideProgram))
            throw ComponentFileError(problem->toStdString());
    }
    QLibrary library(QFileInfo(besideProgram).isFile() ? besideProgram : fileName);
    if (!library.load())
        throw ComponentFileError(library.errorString().toStdString());
    auto registerServer = reinterpret_cast<RegisterServerFunction>(library.resolve(RegisterServerSymbol));
    if (!registerServer)
        throw ComponentFileError(fileName.toStdString() + " has no " + RegisterServerSymbol);
    return registerServer;
}

// The message box names no cause (it is the same for every failure); whoever runs the program from a
// terminal learns the real one here.
void explainFailure(const QString& prefix, const QString& reason)
{
    std::fprintf(
        stderr, "%s: %s cannot be made usable: %s\n", qPrintable(AppTitle()), qPrintable(prefix), qPrintable(reason));
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
    QString failure;

    const auto storeVersion = [&](const QString& version) {
        if (!SaveSetting(AppTitle(), settingsSection(), versionKey(prefix), version))
            failure = QStringLiteral("the settings file %1 cannot be written").arg(SettingsFilePath(AppTitle()));
    };

    CreatedObject created = CreateObject(progId);
    if (!created) {
        std::int32_t status = 0;
        try {
            status = RegisterComponent(prefix);
        } catch (const std::exception& error) {
            failure = QString::fromStdString(error.what());
            status = -1;
        } catch (...) {
            status = -1;
        }
        if (status != 0) {
            if (failure.isEmpty())
                failure = QStringLiteral("its registration into %1 failed with status 0x%2")
                              .arg(ComponentRegistryPath())
                              .arg(quint32(status), 8, 16, QChar(u'0'));
            explainFailure(prefix, failure);
            ShowAdminMessage();
            return false;
        }
        created = CreateObject(progId);
        if (!created)
            failure = QStringLiteral("it was registered, but its version object cannot be created: ") + created.error;
        else if (const auto version = versionText(created.object.get()))
            storeVersion(*version);
        else
            failure = QStringLiteral("its version cannot be read");
    } else if (const auto version = versionText(created.object.get())) {
        // Any difference counts, letter case included; versions are never compared as numbers.
        if (*version != savedVersion)
            storeVersion(*version);
    } else {
        failure = QStringLiteral("its version cannot be read");
    }

    if (!failure.isEmpty()) {
        explainFailure(prefix, failure);
        ShowAdminMessage();
        return false;
    }
    return true;
}

} // namespace Brimvault::modMain
