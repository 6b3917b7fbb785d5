#include "catalogue/CatalogueListing.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/ListBuilder.h"
#include "i18n/LocalizerState.h"
#include "i18n/modLocalizer.h"
#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"
#include "support/ProgramFolder.h"

#include <QDir>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTextStream>

namespace Brimvault::CatalogueListing {

namespace {

QString fileNameOf(const QString& path)
{
    const qsizetype slash = qMax(path.lastIndexOf(u'\\'), path.lastIndexOf(u'/'));
    return path.mid(slash + 1);
}

// Names stored on Windows may differ in letter case from the file on a case-sensitive file system.
QString languageFilePath(const QString& fileName)
{
    const QDir folder(ProgramFolder());
    if (folder.exists(fileName))
        return folder.filePath(fileName);
    const QStringList names = folder.entryList(QDir::Files | QDir::Readable);
    for (const QString& name : names) {
        if (name.compare(fileName, Qt::CaseInsensitive) == 0)
            return folder.filePath(name);
    }
    return folder.filePath(fileName);
}

void loadLanguageFile(const QString& fileName, const QString& shortName)
{
    modLocalizer::detail::SetShortLanguageName(shortName);
    modLocalizer::LoadLanguageFile(languageFilePath(fileName));
}

} // namespace

void LoadLanguageWithoutStoring()
{
    using namespace modLocalizer;
    const QString storedFile = fileNameOf(
        GetSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngFileNameKey).trimmed());
    const QString storedShortName
        = GetSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngNikKey);
    if (!storedFile.isEmpty() && storedFile.compare(BuiltInLanguageName(), Qt::CaseInsensitive) != 0) {
        loadLanguageFile(storedFile, storedShortName.isEmpty() ? ShortNameFromFileName(storedFile) : storedShortName);
        return;
    }
    const qint16 systemCharset = GetSystemCharset();
    for (const LanguageFileInfo& file : ListLanguageFiles()) {
        if (file.charset == systemCharset) {
            loadLanguageFile(file.fileName, ShortNameFromFileName(file.fileName));
            return;
        }
    }
    UseBuiltInLanguage();
}

QList<GameEntry> ListCatalogue()
{
    const CatalogueLocations locations = CatalogueLocations::fromSystem();
    ListBuilder builder(locations.iconsFolder);
    builder.setKeepPictures(false);
    GameDiscovery discovery(builder, locations);
    QList<GameEntry> entries;
    DiscoveryHooks hooks;
    hooks.clearList = [&entries] { entries.clear(); };
    hooks.addItem = [&entries](const GameEntry& entry) { entries.append(entry); };
    discovery.Run(hooks);
    return entries;
}

void WriteCatalogue(const QList<GameEntry>& entries, Format format, QTextStream& out)
{
    if (format == Format::Text) {
        for (const GameEntry& entry : entries)
            out << entry.caption << '\t' << entry.path << '\n';
        return;
    }
    QJsonArray array;
    for (const GameEntry& entry : entries) {
        array.append(QJsonObject {{QStringLiteral("caption"), entry.caption}, {QStringLiteral("path"), entry.path},
            {QStringLiteral("icon"), IconSourceName(entry.source)}});
    }
    out << QString::fromUtf8(QJsonDocument(array).toJson(QJsonDocument::Indented));
}

int PrintCatalogue(Format format, QTextStream& out)
{
    LoadLanguageWithoutStoring();
    WriteCatalogue(ListCatalogue(), format, out);
    out.flush();
    return 0;
}

} // namespace Brimvault::CatalogueListing
