#pragma once

#include <QDateTime>
#include <QHash>
#include <QLatin1String>
#include <QString>

#include <optional>

namespace Brimvault {

// How often and how long a game was played. Kept in the settings store, one value per game in a section of
// its own, so that other tools can read it: "launches,playSeconds,lastPlayed" with lastPlayed in ISO 8601 UTC.
struct PlayRecord {
    qint64 launches = 0;
    qint64 playSeconds = 0;
    QDateTime lastPlayed; // invalid when never played

    bool isEmpty() const { return launches == 0 && playSeconds == 0 && !lastPlayed.isValid(); }
};

namespace PlayHistory {

inline constexpr QLatin1String Section("PlayHistory");

// The game's path trimmed and lower-cased, its separators written as "|": the registry would read "\" and
// "/" in a value name as sub-keys.
QString KeyFor(const QString& path);

// Nothing for a damaged value: a game with one reads as never played, and its next launch starts afresh.
std::optional<PlayRecord> ParseRecord(const QString& value);
QString FormatRecord(const PlayRecord& record);

PlayRecord Read(const QString& path);
// Every readable record by KeyFor of its game.
QHash<QString, PlayRecord> ReadAll();

void RecordLaunch(const QString& path, const QDateTime& when);
void AddPlayTime(const QString& path, qint64 seconds);
void Forget(const QString& path);

} // namespace PlayHistory
} // namespace Brimvault
