#include "app/ComponentRegistry.h"

#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QLockFile>
#include <QSaveFile>

#include <optional>

namespace Brimvault {

namespace {

const QString& progIdSection()
{
    static const QString section = QStringLiteral("ProgIDs");
    return section;
}

// Missing file → empty document; anything else in its place that cannot be read → nothing.
std::optional<IniDocument> readRegistry(const QString& path)
{
    const QFileInfo info(path);
    if (!info.exists())
        return IniDocument();
    // A folder, a pipe or a device in the file's place is never read: a pipe would block the reader.
    QFile file(path);
    if (!info.isFile() || !file.open(QIODevice::ReadOnly))
        return std::nullopt;
    return IniDocument::parse(file.readAll());
}

} // namespace

QString ComponentRegistryPath()
{
    return SettingsDirectory() + QStringLiteral("/components.ini");
}

bool RegisterProgIds(const QStringList& progIds, const QString& libraryPath)
{
    const QString path = ComponentRegistryPath();
    if (!QDir().mkpath(QFileInfo(path).absolutePath()))
        return false;

    // Several components may register at once from different processes.
    QLockFile lock(path + QStringLiteral(".lock"));
    lock.setStaleLockTime(10000);
    if (!lock.tryLock(10000))
        return false;

    std::optional<IniDocument> doc = readRegistry(path);
    if (!doc)
        return false;
    const QString absoluteLibrary = QFileInfo(libraryPath).absoluteFilePath();
    for (const QString& progId : progIds)
        doc->setValue(progIdSection(), progId, absoluteLibrary);

    QSaveFile out(path);
    if (!out.open(QIODevice::WriteOnly))
        return false;
    out.write(doc->serialize());
    return out.commit();
}

QString RegisteredLibrary(const QString& progId)
{
    if (progId.isEmpty())
        return {};
    const std::optional<IniDocument> doc = readRegistry(ComponentRegistryPath());
    if (!doc)
        return {};
    return doc->value(progIdSection(), progId).value_or(QString());
}

} // namespace Brimvault
