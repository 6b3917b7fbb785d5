#include "gameactions/GameRenaming.h"

#include "i18n/modLocalizer.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"

namespace Brimvault {

namespace {

// The display-name key of the first entry holding the path, "FileName" + the text after "File".
std::optional<QString> displayNameKeyOf(const QString& upperPath)
{
    for (const CatalogueStore::AddedGame& game : CatalogueStore::AddedGames()) {
        if (game.path.toUpper().trimmed() == upperPath)
            return CatalogueKeys::FileNameKeyPrefix + game.key.mid(4);
    }
    return std::nullopt;
}

// "Count" + 1, written back; a counter damaged by hand never makes it overwrite an entry in use.
QString recordAsAdded(const QString& upperPath)
{
    return CatalogueStore::DisplayNameKey(CatalogueStore::AddGame(upperPath));
}

} // namespace

std::optional<QString> AskAndRenameGame(const QString& caption, const QString& data)
{
    const QString path = data.toUpper().trimmed();
    if (path.startsWith(QStringLiteral("HTTP")))
        return std::nullopt;
    const std::optional<QString> answer = AskInput({modLocalizer::Translate(770, QStringLiteral("Edit game name")),
        modLocalizer::Translate(1020, QStringLiteral("Brimvault")), caption.trimmed()});
    if (!answer || answer->isEmpty())
        return std::nullopt;

    const QString key = displayNameKeyOf(path).value_or(QString());
    SaveSetting(AppTitle(), CatalogueKeys::FilesNamesSection, key.isEmpty() ? recordAsAdded(path) : key, *answer);
    return *answer;
}

} // namespace Brimvault
