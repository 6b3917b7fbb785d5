#include "catalogue/CatalogueListing.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTextStream>

namespace Brimvault::CatalogueListing {

void LoadLanguageWithoutStoring()
{
    modLocalizer::InitLocalizer(modLocalizer::ChoiceStorage::ReadOnly);
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
