#include "gameactions/GameRemoval.h"

#include "gameactions/CaseInsensitivePath.h"
#include "gameactions/DeleteFolderTree.h"
#include "gameactions/LooseGameFiles.h"
#include "i18n/modLocalizer.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/PlayHistory.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"

#include <QDir>

namespace Brimvault {

namespace {

QString messageTitle()
{
    return modLocalizer::Translate(1020, QStringLiteral("Brimvault"));
}

bool askYesNo(const QString& question)
{
    return ShowPrompt({question, messageTitle(), PromptIcon::Question, PromptButtons::YesNo}) == PromptAnswer::Yes;
}

// Deletes the files of an installed game; true for a game that is not installed.
bool deleteInstalledFiles(const QString& data)
{
    // Cleaned first, so that a path climbing out with ".." is never taken for one inside the games folder.
    const QString games = QDir::cleanPath(DataFolders::GamesFolder().trimmed());
    const QString target = QDir::cleanPath(ExistingPathIgnoringCase(data.trimmed()));
    if (DataFolders::GamesFolder().trimmed().isEmpty() || !target.toLower().startsWith(games.toLower() + u'/'))
        return true;
    const QString rest = target.mid(games.size() + 1);
    if (rest.contains(u'/'))
        return DeleteFolderTree(target.left(target.lastIndexOf(u'/')));
    return RemoveLooseGameFiles(games, rest);
}

void forgetAddedEntries(const QString& upperPath)
{
    for (const CatalogueStore::AddedGame& game : CatalogueStore::AddedGames()) {
        if (game.path.toUpper().trimmed() == upperPath)
            CatalogueStore::RemoveGame(game.key);
    }
}

} // namespace

RemovalOutcome AskAndRemoveGame(const QString& caption, const QString& data)
{
    if (!askYesNo(modLocalizer::Translate(760, QStringLiteral("Remove ")) + caption.trimmed() + u'?'))
        return RemovalOutcome::Cancelled;
    if (!deleteInstalledFiles(data)) {
        ShowPrompt({modLocalizer::Translate(1260, QStringLiteral("There was an error! The game isn't removed!")),
            messageTitle(), PromptIcon::Critical, PromptButtons::Ok});
        return RemovalOutcome::Failed;
    }
    forgetAddedEntries(data.toUpper().trimmed());
    PlayHistory::Forget(data);
    return RemovalOutcome::Removed;
}

bool AskAndRemoveAllAddedGames()
{
    const QString question = modLocalizer::Translate(1100, QStringLiteral("Remove all added games..."))
                                 .replace(QStringLiteral("..."), QStringLiteral("?      "));
    if (!askYesNo(question))
        return false;
    const QList<CatalogueStore::AddedGame> games = CatalogueStore::AddedGames();
    if (!DeleteSection(AppTitle(), CatalogueKeys::FilesSection))
        return false;
    for (const CatalogueStore::AddedGame& game : games)
        PlayHistory::Forget(game.path);
    return true;
}

} // namespace Brimvault
