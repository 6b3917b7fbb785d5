#include "catalogue/GameAdder.h"

#include "catalogue/FolderWalk.h"
#include "catalogue/GameFileRules.h"
#include "catalogue/ListBuilder.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/SettingsStore.h"
#include "support/PathFunctions.h"

#include <limits>

namespace Brimvault {

GameAdder::GameAdder(ListBuilder& builder)
    : m_builder(builder)
{ }

QString GameAdder::RecordAddedGame(const QString& path)
{
    const QString key = CatalogueStore::AddGame(path);
    m_builder.addedGames().noteAddedGame(key, path);
    return key;
}

std::optional<GameEntry> GameAdder::AddGameFile(const QString& file)
{
    if (file.isEmpty() || m_builder.IsGameListed(file))
        return std::nullopt;
    RecordAddedGame(file);
    GameEntry entry = m_builder.AddGameToList(file);
    m_builder.endPass();
    return entry;
}

QList<GameEntry> GameAdder::AddGamesFromFolder(const QString& folder, const EntrySink& sink)
{
    QList<GameEntry> added;
    if (folder.isEmpty())
        return added;
    const QString root = AddSlash(folder);
    QList<FolderWalk::WalkedFolder> folders = FolderWalk::CollectSubfolders(root);
    folders.append({root, std::nullopt});

    // A counter below a number still in use (edited by hand) must not give that number out again.
    int count = CatalogueStore::EntryCount();
    for (const CatalogueStore::AddedGame& game : CatalogueStore::AddedGames())
        count = qMax(count, game.number());

    for (const FolderWalk::WalkedFolder& walked : std::as_const(folders)) {
        for (const QString& name : FolderWalk::FilesOf(walked)) {
            if (!GameFileRules::HasAcceptedExtension(name) || GameFileRules::IsExcludedName(name)
                || GameFileRules::LooksLikeInstaller(name))
                continue;
            const QString full = walked.path + name;
            if (GameFileRules::IsInstallerByVersion(full) || m_builder.IsGameListed(full))
                continue;
            const int number = CatalogueStore::NextEntryNumber(count, m_builder.addedGames().games());
            count = qMax(count, number);
            const QString key = CatalogueKeys::FileKeyPrefix + QString::number(number);
            SaveSetting(AppTitle(), CatalogueKeys::FilesSection, key, full);
            m_builder.addedGames().noteAddedGame(key, full);
            added.append(m_builder.AddGameToList(full));
            if (sink)
                sink(added.constLast());
        }
    }
    SaveSetting(AppTitle(), CatalogueKeys::FilesSection, CatalogueKeys::CountKey, QString::number(count));
    m_builder.endPass();
    return added;
}

QList<GameEntry> GameAdder::AddDroppedFiles(const QStringList& files, const EntrySink& sink)
{
    QList<GameEntry> added;
    // The drop counts its files in 16 bits: beyond that the handler gives up.
    const qsizetype usable = qMin<qsizetype>(files.size(), std::numeric_limits<qint16>::max());
    for (qsizetype i = 0; i < usable; ++i) {
        const QString& file = files.at(i);
        if (GetFileExtention(file, false, false).toUpper() != QLatin1String("EXE") || m_builder.IsGameListed(file))
            continue;
        RecordAddedGame(file);
        added.append(m_builder.AddGameToList(file));
        if (sink)
            sink(added.constLast());
    }
    m_builder.endPass();
    return added;
}

} // namespace Brimvault
