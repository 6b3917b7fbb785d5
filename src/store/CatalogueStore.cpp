#include "store/CatalogueStore.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include <QSet>

#include <limits>

namespace Brimvault::CatalogueStore {

namespace {

bool isCounterKey(const QString& key)
{
    return key.trimmed().toLower() == QLatin1String("count");
}

} // namespace

int AddedGame::number() const
{
    if (!key.startsWith(CatalogueKeys::FileKeyPrefix, Qt::CaseInsensitive))
        return 0;
    bool ok = false;
    const int n = key.mid(CatalogueKeys::FileKeyPrefix.size()).trimmed().toInt(&ok);
    return ok && n > 0 ? n : 0;
}

QList<AddedGame> AddedGames()
{
    QList<AddedGame> games;
    const auto pairs = GetAllSettings(AppTitle(), CatalogueKeys::FilesSection);
    for (const auto& [key, value] : pairs) {
        if (!isCounterKey(key))
            games.append({key, value});
    }
    return games;
}

int EntryCount()
{
    bool ok = false;
    const int count = GetSetting(AppTitle(), CatalogueKeys::FilesSection, CatalogueKeys::CountKey).trimmed().toInt(&ok);
    return ok && count > 0 ? count : 0;
}

int NextEntryNumber(int highest, const QList<AddedGame>& games)
{
    if (highest < std::numeric_limits<int>::max())
        return qMax(highest, 0) + 1;
    QSet<int> used;
    for (const AddedGame& game : games)
        used.insert(game.number());
    int number = 1;
    while (used.contains(number))
        ++number;
    return number;
}

QString AddGame(const QString& path)
{
    // A counter lost or damaged by hand must not hand out a number that is still in use.
    const QList<AddedGame> games = AddedGames();
    int highest = EntryCount();
    for (const AddedGame& game : games)
        highest = qMax(highest, game.number());
    const int number = NextEntryNumber(highest, games);
    const QString key = CatalogueKeys::FileKeyPrefix + QString::number(number);
    SaveSetting(
        AppTitle(), CatalogueKeys::FilesSection, CatalogueKeys::CountKey, QString::number(qMax(highest, number)));
    SaveSetting(AppTitle(), CatalogueKeys::FilesSection, key, path);
    return key;
}

QString NormalisedPath(const QString& path)
{
    return path.trimmed().toLower();
}

QHash<QString, AddedGame> IndexByPath(const QList<AddedGame>& games)
{
    QHash<QString, AddedGame> index;
    index.reserve(games.size());
    for (const AddedGame& game : games) {
        const QString path = NormalisedPath(game.path);
        if (!index.contains(path))
            index.insert(path, game);
    }
    return index;
}

bool SamePath(const QString& a, const QString& b)
{
    return NormalisedPath(a) == NormalisedPath(b);
}

std::optional<AddedGame> FindAddedGame(const QList<AddedGame>& games, const QString& path)
{
    for (const AddedGame& game : games) {
        if (SamePath(game.path, path))
            return game;
    }
    return std::nullopt;
}

std::optional<AddedGame> FindAddedGame(const QString& path)
{
    return FindAddedGame(AddedGames(), path);
}

void RemoveGame(const QString& fileKey)
{
    DeleteSetting(AppTitle(), CatalogueKeys::FilesSection, fileKey);
    DeleteSetting(AppTitle(), CatalogueKeys::FilesNamesSection, DisplayNameKey(fileKey));
}

void RemoveAllAddedGames()
{
    DeleteSection(AppTitle(), CatalogueKeys::FilesSection);
}

QString DisplayNameKey(const QString& fileKey)
{
    QString key = fileKey;
    return key.replace(CatalogueKeys::FileKeyPrefix, CatalogueKeys::FileNameKeyPrefix, Qt::CaseInsensitive);
}

QString DisplayName(const QString& fileKey)
{
    return GetSetting(AppTitle(), CatalogueKeys::FilesNamesSection, DisplayNameKey(fileKey));
}

void SetDisplayName(const QString& fileKey, const QString& name)
{
    SaveSetting(AppTitle(), CatalogueKeys::FilesNamesSection, DisplayNameKey(fileKey), name);
}

} // namespace Brimvault::CatalogueStore
