#include "store/PlayHistory.h"

#include "store/SettingsStore.h"

#include <QStringList>

namespace Brimvault::PlayHistory {

namespace {

void write(const QString& path, const PlayRecord& record)
{
    SaveSetting(AppTitle(), Section, KeyFor(path), FormatRecord(record));
}

} // namespace

QString KeyFor(const QString& path)
{
    QString key = path.trimmed().toLower();
    key.replace(u'\\', u'|');
    key.replace(u'/', u'|');
    return key;
}

std::optional<PlayRecord> ParseRecord(const QString& value)
{
    const QStringList parts = value.trimmed().split(u',');
    if (parts.size() != 3)
        return std::nullopt;
    bool launchesOk = false;
    bool secondsOk = false;
    PlayRecord record;
    record.launches = parts.at(0).trimmed().toLongLong(&launchesOk);
    record.playSeconds = parts.at(1).trimmed().toLongLong(&secondsOk);
    if (!launchesOk || !secondsOk || record.launches < 0 || record.playSeconds < 0)
        return std::nullopt;
    const QString when = parts.at(2).trimmed();
    if (!when.isEmpty()) {
        record.lastPlayed = QDateTime::fromString(when, Qt::ISODate);
        if (!record.lastPlayed.isValid())
            return std::nullopt;
    }
    return record;
}

QString FormatRecord(const PlayRecord& record)
{
    const QString when = record.lastPlayed.isValid() ? record.lastPlayed.toUTC().toString(Qt::ISODate) : QString();
    return QString::number(record.launches) + u',' + QString::number(record.playSeconds) + u',' + when;
}

PlayRecord Read(const QString& path)
{
    return ParseRecord(GetSetting(AppTitle(), Section, KeyFor(path))).value_or(PlayRecord {});
}

QHash<QString, PlayRecord> ReadAll()
{
    QHash<QString, PlayRecord> records;
    const QList<QPair<QString, QString>> pairs = GetAllSettings(AppTitle(), Section);
    for (const auto& [key, value] : pairs) {
        if (const std::optional<PlayRecord> record = ParseRecord(value))
            records.insert(KeyFor(key), *record);
    }
    return records;
}

void RecordLaunch(const QString& path, const QDateTime& when)
{
    PlayRecord record = Read(path);
    ++record.launches;
    record.lastPlayed = when;
    write(path, record);
}

void AddPlayTime(const QString& path, qint64 seconds)
{
    if (seconds <= 0)
        return;
    PlayRecord record = Read(path);
    record.playSeconds += seconds;
    write(path, record);
}

void Forget(const QString& path)
{
    DeleteSetting(AppTitle(), Section, KeyFor(path));
}

} // namespace Brimvault::PlayHistory
