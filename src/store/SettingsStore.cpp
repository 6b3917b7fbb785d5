#include "store/SettingsStore.h"

#include "store/IniDocument.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QHash>
#include <QMutex>
#include <QSaveFile>
#include <QSettings>
#include <QStandardPaths>

#include <functional>
#include <memory>

#ifndef Q_OS_WIN
#include <QElapsedTimer>
#include <QThread>

#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>
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
    std::shared_ptr<const IniDocument> doc;
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
    const QFileInfo info(path);
    if (!info.exists())
        return ReadState::Missing;
    // A folder, a pipe or a device in the file's place is never read: a pipe would block the reader.
    if (!info.isFile())
        return ReadState::Unreadable;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return ReadState::Unreadable;
    bytes = file.readAll();
    return file.error() == QFileDevice::NoError ? ReadState::Read : ReadState::Unreadable;
}

std::shared_ptr<const IniDocument> parsedDocument(const QString& path, const QByteArray& bytes)
{
    QMutexLocker lock(&cacheMutex);
    auto it = cache().find(path);
    if (it != cache().end() && it->bytes == bytes)
        return it->doc;
    auto doc = std::make_shared<const IniDocument>(IniDocument::parse(bytes));
    cache().insert(path, {bytes, doc});
    return doc;
}

std::shared_ptr<const IniDocument> currentDocument(const QString& path)
{
    QByteArray bytes;
    if (readBytes(path, bytes) != ReadState::Read)
        return std::make_shared<const IniDocument>();
    return parsedDocument(path, bytes);
}

// One writer at a time across processes. The kernel drops a flock() when its holder ends, so a writer that
// crashed never leaves a stale lock behind, and a waiting writer gets the lock as soon as it is free.
class WriteLock {
public:
    explicit WriteLock(const QString& lockPath)
        : m_fd(::open(QFile::encodeName(lockPath).constData(), O_RDWR | O_CREAT | O_CLOEXEC, 0600))
    { }
    ~WriteLock()
    {
        if (m_fd >= 0)
            ::close(m_fd);
    }
    WriteLock(const WriteLock&) = delete;
    WriteLock& operator=(const WriteLock&) = delete;

    bool acquire(int timeoutMs)
    {
        if (m_fd < 0)
            return false;
        QElapsedTimer waited;
        waited.start();
        while (::flock(m_fd, LOCK_EX | LOCK_NB) != 0) {
            if ((errno != EWOULDBLOCK && errno != EINTR) || waited.hasExpired(timeoutMs))
                return false;
            QThread::msleep(1);
        }
        return true;
    }

private:
    int m_fd;
};

// Read, change and write back under a lock, so that two processes writing at once both keep their
// change. A file that exists but cannot be read is never overwritten.
bool modifyDocument(const QString& appName, const std::function<bool(IniDocument&)>& change)
{
    const QString path = SettingsFilePath(appName);
    if (!QDir().mkpath(QFileInfo(path).absolutePath()))
        return false;
    WriteLock lock(path + QStringLiteral(".lock"));
    if (!lock.acquire(10000))
        return false;

    QByteArray bytes;
    const ReadState state = readBytes(path, bytes);
    if (state == ReadState::Unreadable)
        return false;
    IniDocument doc = state == ReadState::Read ? *parsedDocument(path, bytes) : IniDocument();
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
    cache().insert(path, {changed, std::make_shared<const IniDocument>(std::move(doc))});
    return true;
}

} // namespace

QString GetSetting(const QString& appName, const QString& section, const QString& key, const QString& defaultValue)
{
    return currentDocument(SettingsFilePath(appName))->value(section, key).value_or(defaultValue);
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
    return currentDocument(SettingsFilePath(appName))->sectionPairs(section);
}

#endif

} // namespace Brimvault
