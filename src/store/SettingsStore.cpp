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

#ifdef Q_OS_UNIX
#include <sys/stat.h>
#endif

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
        pairs.append({ key, s.value(key).toString() });
    return pairs;
}

#else

namespace {

    // Identifies one version of the file. Writers replace the file by rename, so the inode changes on
    // every write even when the size and the time stamp's resolution would not tell.
    struct FileStamp {
        bool exists = false;
        qint64 inode = 0;
        qint64 size = 0;
        qint64 mtimeNs = 0;
        bool operator==(const FileStamp&) const = default;
    };

    FileStamp stampOf(const QString& path)
    {
        struct stat st {};
        if (::stat(QFile::encodeName(path).constData(), &st) != 0)
            return {};
        return { true, qint64(st.st_ino), qint64(st.st_size), qint64(st.st_mtim.tv_sec) * 1000000000 + st.st_mtim.tv_nsec };
    }

    struct CachedFile {
        FileStamp stamp;
        IniDocument doc;
    };

    QMutex cacheMutex;
    QHash<QString, CachedFile>& cache()
    {
        static QHash<QString, CachedFile> files;
        return files;
    }

    enum class ReadState { Missing, Read, Unreadable };

    ReadState readDocument(const QString& path, IniDocument& doc)
    {
        QFile file(path);
        if (!file.exists())
            return ReadState::Missing;
        if (!file.open(QIODevice::ReadOnly))
            return ReadState::Unreadable;
        doc = IniDocument::parse(file.readAll());
        return ReadState::Read;
    }

    // The current content of the file, re-read only when it changed since the last look.
    IniDocument currentDocument(const QString& path)
    {
        QMutexLocker lock(&cacheMutex);
        const FileStamp stamp = stampOf(path);
        auto it = cache().find(path);
        if (it != cache().end() && it->stamp == stamp && stamp.exists)
            return it->doc;
        IniDocument doc;
        if (readDocument(path, doc) != ReadState::Read) {
            cache().remove(path);
            return {};
        }
        cache().insert(path, { stamp, doc });
        return doc;
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

        IniDocument doc;
        if (readDocument(path, doc) == ReadState::Unreadable)
            return false;
        if (!change(doc))
            return true;

        QSaveFile out(path);
        if (!out.open(QIODevice::WriteOnly))
            return false;
        out.write(doc.serialize());
        if (!out.commit())
            return false;

        QMutexLocker cacheLock(&cacheMutex);
        cache().insert(path, { stampOf(path), doc });
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
