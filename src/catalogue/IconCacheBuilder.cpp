#include "catalogue/IconCacheBuilder.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/IconCacheKey.h"
#include "icons/NumberedError.h"
#include "icons/cFileIcon.h"

#include <QDir>
#include <QFileInfo>

namespace Brimvault {

IconCacheBuilder::IconCacheBuilder(const QString& iconsFolder)
    : m_iconsFolder(iconsFolder)
{ }

void IconCacheBuilder::enqueue(const QString& path, quint64 ticket)
{
    m_queue.append({path, ticket});
}

void IconCacheBuilder::clear()
{
    m_queue.clear();
}

std::optional<IconCacheBuilder::Done> IconCacheBuilder::Tick(bool closing)
{
    if (closing || m_queue.isEmpty())
        return std::nullopt;
    const Work work = m_queue.takeFirst();
    return Done {work.ticket, work.path, BuildIcon(work.path)};
}

IconCacheBuilder::Result IconCacheBuilder::BuildIcon(const QString& path) const
{
    Result result;
    result.cacheFile = IconCacheFile(m_iconsFolder, path);
    const QString cacheFile = FileSystemPath(result.cacheFile);
    try {
        cFileIcon cached;
        // Anything but a regular file in the cache file's place (a pipe would block the window) is no cache.
        if (!cacheFile.isEmpty() && QFileInfo(cacheFile).isFile() && cached.LoadIcon(cacheFile)) {
            result.picture = cached.ScreenIconPicture();
            if (!result.picture.isNull()) {
                result.outcome = Outcome::FromCache;
                return result;
            }
        }
    } catch (const NumberedError&) { }

    cFileIcon icon;
    try {
        if (!icon.LoadMainIconFromEXE(FileSystemPath(path)))
            return result;
    } catch (const NumberedError&) {
        return result;
    }
    // Only a new or a regular file is written: a pipe in its place would block the window, and a link in the
    // cache that all users share could point anywhere.
    const QFileInfo existing(cacheFile);
    if (!cacheFile.isEmpty() && !existing.isSymLink() && (!existing.exists() || existing.isFile())) {
        // Only the cache folder itself is made; its parent belongs to the installation.
        const QString folder = QFileInfo(cacheFile).absolutePath();
        if (!QFileInfo(folder).isDir())
            QDir().mkdir(folder);
        try {
            result.saved = icon.SaveIcon(cacheFile);
        } catch (const NumberedError&) {
            result.saved = false;
        }
    }
    result.picture = icon.ScreenIconPicture();
    result.outcome = result.picture.isNull() ? Outcome::NoIcon : Outcome::Extracted;
    return result;
}

} // namespace Brimvault
