#include "catalogue/AddedGamesSnapshot.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"
#include "support/TextCase.h"

namespace Brimvault {

namespace {

QString normalised(const QString& path)
{
    return LowerCased(path.trimmed());
}

} // namespace

void AddedGamesSnapshot::read()
{
    m_games.clear();
    m_keyByPath.clear();
    m_nameByKey.clear();
    m_count = 0;
    const auto files = GetAllSettings(AppTitle(), CatalogueKeys::FilesSection);
    for (const auto& [key, value] : files) {
        if (key.trimmed().toLower() == QLatin1String("count")) {
            bool ok = false;
            const int count = value.trimmed().toInt(&ok);
            if (ok)
                m_count = qMax(m_count, count);
            continue;
        }
        noteAddedGame(key, value);
    }
    const auto names = GetAllSettings(AppTitle(), CatalogueKeys::FilesNamesSection);
    // A key written twice by hand reads as the store reads it: the first one counts.
    for (const auto& [key, value] : names) {
        const QString lowerKey = key.toLower();
        if (!m_nameByKey.contains(lowerKey))
            m_nameByKey.insert(lowerKey, value);
    }
}

QString AddedGamesSnapshot::userName(const QString& path) const
{
    return userNameOfKnownPath(normalised(path));
}

QString AddedGamesSnapshot::userNameOfKnownPath(const QString& knownPath) const
{
    const QString key = m_keyByPath.value(knownPath);
    if (key.isEmpty())
        return QString();
    const QString number = key.mid(CatalogueKeys::FileKeyPrefix.size());
    return m_nameByKey.value((CatalogueKeys::FileNameKeyPrefix + number).toLower());
}

int AddedGamesSnapshot::highestNumber() const
{
    int highest = m_count;
    for (const CatalogueStore::AddedGame& game : m_games)
        highest = qMax(highest, game.number());
    return highest;
}

void AddedGamesSnapshot::noteAddedGame(const QString& key, const QString& path)
{
    m_games.append({key, path});
    const QString normalisedPath = normalised(path);
    if (!m_keyByPath.contains(normalisedPath))
        m_keyByPath.insert(normalisedPath, key);
    const int number = m_games.constLast().number();
    m_count = qMax(m_count, number);
}

} // namespace Brimvault
