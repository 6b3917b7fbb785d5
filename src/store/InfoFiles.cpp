#include "store/InfoFiles.h"

#include "store/BagFileIo.h"
#include "store/CatalogueKeys.h"
#include "store/clsFileBag.h"

namespace Brimvault::InfoFiles {

namespace {

// The value of the one-part record, trimmed; whitespace also covers a final line end written by an
// editor that ends lines with LF only.
QString recordValue(const clsFileBag& bag, const QString& part)
{
    return bag.GetValue(clsFileBag::MakeKey(part)).trimmed();
}

// The keys of a game's name records for one language; a list reads thousands of info files in one language,
// so the keys are made once.
struct NameKeys {
    QString language;
    QString localised;
    QString plain;
};

const NameKeys& nameKeysFor(const QString& lngNik)
{
    static NameKeys keys {QString(), clsFileBag::MakeKey(CatalogueKeys::NameRecord + u'_'),
        clsFileBag::MakeKey(CatalogueKeys::NameRecord)};
    if (keys.language != lngNik)
        keys = {lngNik, clsFileBag::MakeKey(CatalogueKeys::NameRecord + u'_' + lngNik), keys.plain};
    return keys;
}

} // namespace

InfoFileParts GameInfoFileParts(const QString& gamePath)
{
    QStringView path(gamePath);
    if (const qsizetype query = path.indexOf(u'?'); query >= 0)
        path = path.left(query);
    const qsizetype separator = qMax(path.lastIndexOf(u'\\'), path.lastIndexOf(u'/'));
    const QStringView name = path.sliced(separator + 1);
    const qsizetype dot = name.lastIndexOf(u'.');
    const QStringView title = dot < 0 ? name : name.left(dot);
    return {separator < 0 ? QStringLiteral(".\\") : path.left(separator + 1).toString(),
        title % CatalogueKeys::InfoFileExtension};
}

QString GameInfoFileName(const QString& gamePath)
{
    const InfoFileParts parts = GameInfoFileParts(gamePath);
    return parts.folder + parts.name;
}

QString GameInfoName(const QString& gamePath, const QString& lngNik)
{
    return ReadGameName(GameInfoFileName(gamePath), lngNik);
}

QString ReadGameName(const QString& infoFile, const QString& lngNik)
{
    // A missing info file, or a folder in its place, reads as an empty bag.
    clsFileBag bag;
    bag.OpenFile(infoFile);
    const NameKeys& keys = nameKeysFor(lngNik);
    const QString localised = bag.GetValue(keys.localised).trimmed();
    return localised.isEmpty() ? bag.GetValue(keys.plain).trimmed() : localised;
}

QString DirInfoFileName(const QString& folder)
{
    if (folder.isEmpty() || folder.endsWith(u'/') || folder.endsWith(u'\\'))
        return folder + CatalogueKeys::DirInfoFileName;
    const QChar separator = folder.lastIndexOf(u'\\') > folder.lastIndexOf(u'/') ? u'\\' : u'/';
    return folder + separator + CatalogueKeys::DirInfoFileName;
}

bool IsStopFolder(const QString& folder)
{
    return IsStopMark(DirInfoFileName(folder));
}

bool IsStopMark(const QString& infoFile)
{
    if (!BagFileIo::isFile(infoFile))
        return false;
    clsFileBag bag;
    bag.OpenFile(infoFile);
    return recordValue(bag, CatalogueKeys::StopDirRecord) == CatalogueKeys::StopDirYes;
}

} // namespace Brimvault::InfoFiles
