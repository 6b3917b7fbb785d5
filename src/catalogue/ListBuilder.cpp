#include "catalogue/ListBuilder.h"

#include "app/clsFileVersion.h"
#include "catalogue/CatalogueLocations.h"
#include "catalogue/CatalogueServer.h"
#include "catalogue/GameNames.h"
#include "catalogue/IconCacheKey.h"
#include "i18n/modLocalizer.h"
#include "icons/NumberedError.h"
#include "icons/cFileIcon.h"
#include "store/InfoFiles.h"
#include "support/PathFunctions.h"
#include "support/ReadOnlyFile.h"
#include "support/TextCase.h"

namespace Brimvault {

namespace {

QString knownPathOf(const QString& path)
{
    return LowerCased(path.trimmed());
}

// Whether an icon file is there and holds a usable picture, and that picture. Where the picture is sure to
// come out of the file's best image, it is left to be decoded when shown: a long list shows few of them,
// and keeps neither images nor pictures for the rest.
struct IconPicture {
    bool usable = false;
    QImage picture;
};

IconPicture pictureOf(const QString& iconFile, bool decodeLater, const OpenFolder* folder = nullptr)
{
    // LoadIcon reads only a regular file: a named pipe in the icon's place cannot block the window.
    if (iconFile.isEmpty())
        return {};
    try {
        cFileIcon icon;
        const bool loaded
            = folder ? icon.LoadIcon(FileSystemPath(iconFile), *folder) : icon.LoadIcon(FileSystemPath(iconFile));
        if (!loaded)
            return {};
        if (decodeLater && icon.ScreenPictureIsSound())
            return {true, {}};
        QImage picture = icon.ScreenIconPicture();
        return {!picture.isNull(), std::move(picture)};
    } catch (const NumberedError&) {
        return {};
    }
}

} // namespace

ListBuilder::ListBuilder(const QString& iconsFolder)
    : m_iconsFolder(iconsFolder)
{ }

ListBuilder::~ListBuilder() = default;

void ListBuilder::beginPass()
{
    m_addedGames.read();
    m_languageTag = modLocalizer::ShortLanguageName();
    m_knownPaths.clear();
    m_sideFiles.clear();
    m_openIconsFolder = std::make_unique<OpenFolder>(FileSystemPath(m_iconsFolder));
}

void ListBuilder::endPass()
{
    m_sideFiles.clear();
    m_openIconsFolder.reset();
}

QImage ListBuilder::ShownPicture(const QString& iconFile)
{
    return pictureOf(iconFile, false).picture;
}

GameEntry ListBuilder::OnlineGamesEntry() const
{
    GameEntry entry;
    entry.caption = modLocalizer::Translate(1250, QStringLiteral("Online games"));
    entry.path = OnlineCatalogueAddress();
    entry.source = IconSource::Online;
    return entry;
}

QString ListBuilder::RawDisplayName(const QString& path) const
{
    return rawDisplayName(path, knownPathOf(path));
}

QString ListBuilder::rawDisplayName(const QString& path, const QString& knownPath) const
{
    QString name = m_addedGames.userNameOfKnownPath(knownPath);
    if (name.isEmpty()) {
        const InfoFiles::InfoFileParts info = InfoFiles::GameInfoFileParts(path);
        const QString found = m_sideFiles.find(info.folder, info.name);
        if (!found.isEmpty())
            name = InfoFiles::ReadGameName(found, m_languageTag);
    }
    const QString fileTitle = GetFileName(path, false);
    if (name.isEmpty())
        name = GameNames::BuiltInName(fileTitle);
    if (name.isEmpty()) {
        clsFileVersion version;
        if (version.ReadVersion(FileSystemPath(path)))
            name = version.FileDescription().trimmed();
    }
    return name.isEmpty() ? fileTitle : name;
}

void ListBuilder::chooseIcon(GameEntry& entry) const
{
    // The game's own icon lies beside it under the game's file title; a title never holds a separator.
    const QString ownIcon
        = m_sideFiles.find(GetFileFolder(entry.path, false), GetFileName(entry.path, false) + QLatin1String(".ico"));
    const bool hasOwnIcon = !ownIcon.isEmpty();
    const QString candidate = hasOwnIcon ? ownIcon : IconCacheFile(m_iconsFolder, entry.path);
    IconPicture found = pictureOf(candidate, true, m_openIconsFolder.get());
    if (found.usable) {
        entry.source = hasOwnIcon ? IconSource::File : IconSource::Cache;
        entry.iconFile = candidate;
        if (m_keepPictures)
            entry.picture = std::move(found.picture);
    } else if (GetFileExtention(entry.path, false, false).toLower() == QLatin1String("swf")) {
        entry.source = IconSource::Flash;
    } else {
        entry.source = IconSource::Queued;
    }
}

GameEntry ListBuilder::AddGameToList(const QString& path)
{
    GameEntry entry;
    entry.path = path;
    QString knownPath = knownPathOf(path);
    entry.caption = GameNames::TidyName(rawDisplayName(path, knownPath));
    chooseIcon(entry);
    m_knownPaths.insert(std::move(knownPath));
    return entry;
}

bool ListBuilder::IsGameListed(const QString& path) const
{
    return m_knownPaths.contains(knownPathOf(path));
}

void ListBuilder::ForgetGame(const QString& path)
{
    m_knownPaths.remove(knownPathOf(path));
    m_addedGames.read();
}

} // namespace Brimvault
