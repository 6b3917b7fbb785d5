#include "store/SettingsStore.h"

#include "store/IniDocument.h"

#include <QDir>
#include <QFile>
#include <QHash>
#include <QLockFile>
#include <QMutex>
#include <QSaveFile>
#include <QSettings>
#include <QStandardPaths>

#include <functional>

namespace Brimvault {

QString AppTitle()
{
    return QStringLiteral("Brimvault");
}

QString SettingsDirectory()
{
    const QString overridden = qEnvironmentVariable("BRIMVAULT_SETTINGS_DIR");
    if (!overridden.isEmpty())
        return QDir::cleanPath(overridden);
    return QStandardPaths::writableLocation(QStandardPaths::GenericConfigLocation) + QStringLiteral("/Brimvault");
}

QString SettingsFilePath(const QString& appName)
{
    return SettingsDirectory() + u'/' + appName + QStringLiteral(".ini");
}

#ifdef Q_OS_WIN

// The registry is case-insensitive and live by nature: QSettings over it is all we need.
namespace {
QSettings registryFor(const QString& appName)
{
    return QSettings(QStringLiteral("HKEY_CURRENT_USER\\Software\\VB and VBA Program Settings\\") + appName,
        QSettings::NativeFormat);
}
} // namespace

QString GetSetting(const QString& appName, const QString& section, const QString& key, const QString& defaultValue)
{
    auto s = registryFor(appName);
    return s.value(section + u'/' + key, defaultValue).toString();
}

bool SaveSetting(const QString& appName, const QString& section, const QString& key, const QString& value)
{
    auto s = registryFor(appName);
    s.setValue(section + u'/' + key, value);
    s.sync();
    return s.status() == QSettings::NoError;
}

bool DeleteSetting(const QString& appName, const QString& section, const QString& key)
{
    auto s = registryFor(appName);
    const bool had = s.contains(section + u'/' + key);
    s.remove(section + u'/' + key);
    return had;
}

bool DeleteSection(const QString& appName, const QString& section)
{
    auto s = registryFor(appName);
    const bool had = s.childGroups().contains(section, Qt::CaseInsensitive);
    s.remove(section);
    return had;
}

QList<QPair<QString, QString>> GetAllSettings(const QString& appName, const QString& section)
{
    auto s = registryFor(appName);
    s.beginGroup(section);
    QList<QPair<QString, QString>> pairs;
    for (const QString& key : s.childKeys())
        pairs.append({key, s.value(key).toString()});
    return pairs;
}

#else

namespace {

// The parsed form of the bytes last seen. Every read looks at the file itself, because another process
// (the service) may have replaced it in the meantime; only the parsing is saved when nothing changed.
// File stamps cannot tell: a same-size rewrite within the clock's tick may even reuse the inode.
struct CachedFile {
    QByteArray bytes;
    IniDocument doc;
};

QMutex cacheMutex;
QHash<QString, CachedFile>& cache()
{
    static QHash<QString, CachedFile> files;
    return files;
}

enum class ReadState { Missing, Read, Unreadable };

ReadState readBytes(const QString& path, QByteArray& bytes)
{
    QFile file(path);
    if (!file.exists())
        return ReadState::Missing;
    if (!file.open(QIODevice::ReadOnly))
        return ReadState::Unreadable;
    bytes = file.readAll();
    return file.error() == QFileDevice::NoError ? ReadState::Read : ReadState::Unreadable;
}

IniDocument parsedDocument(const QString& path, const QByteArray& bytes)
{
    QMutexLocker lock(&cacheMutex);
    auto it = cache().find(path);
    if (it != cache().end() && it->bytes == bytes)
        return it->doc;
    IniDocument doc = IniDocument::parse(bytes);
    cache().insert(path, {bytes, doc});
    return doc;
}

IniDocument currentDocument(const QString& path)
{
    QByteArray bytes;
    if (readBytes(path, bytes) != ReadState::Read)
        return {};
    return parsedDocument(path, bytes);
}

// Read, change and write back under a lock file, so that two processes writing at once both keep their
// change. A file that exists but cannot be read is never overwritten.
bool modifyDocument(const QString& appName, const std::function<bool(IniDocument&)>& change)
{
    const QString path = SettingsFilePath(appName);
    if (!QDir().mkpath(QFileInfo(path).absolutePath()))
        return false;
    QLockFile lock(path + QStringLiteral(".lock"));
    lock.setStaleLockTime(10000);
    if (!lock.tryLock(10000))
        return false;

    QByteArray bytes;
    if (readBytes(path, bytes) == ReadState::Unreadable)
        return false;
    IniDocument doc = parsedDocument(path, bytes);
    if (!change(doc))
        return true;

    const QByteArray changed = doc.serialize();
    QSaveFile out(path);
    if (!out.open(QIODevice::WriteOnly))
        return false;
    out.write(changed);
    if (!out.commit())
        return false;

    QMutexLocker cacheLock(&cacheMutex);
    cache().insert(path, {changed, doc});
    return true;
}

} // namespace

QString GetSetting(const QString& appName, const QString& section, const QString& key, const QString& defaultValue)
{
    return currentDocument(SettingsFilePath(appName)).value(section, key).value_or(defaultValue);
}

bool SaveSetting(const QString& appName, const QString& section, const QString& key, const QString& value)
{
    return modifyDocument(appName, [&](IniDocument& doc) {
        doc.setValue(section, key, value);
        return true;
    });
}

bool DeleteSetting(const QString& appName, const QString& section, const QString& key)
{
    bool removed = false;
    modifyDocument(appName, [&](IniDocument& doc) { return removed = doc.removeValue(section, key); });
    return removed;
}

bool DeleteSection(const QString& appName, const QString& section)
{
    bool removed = false;
    modifyDocument(appName, [&](IniDocument& doc) { return removed = doc.removeSection(section); });
    return removed;
}

QList<QPair<QString, QString>> GetAllSettings(const QString& appName, const QString& section)
{
    return currentDocument(SettingsFilePath(appName)).sectionPairs(section);
}

#endif

} // namespace Brimvault
