#include "catalogue/CatalogueListing.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/GameFinder.h"
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

QList<GameEntry> ShownEntries(
    QList<GameEntry> entries, const QString& find, ListOrder order, const QHash<QString, PlayRecord>& history)
{
    ListOrders::Sort(entries, order, history);
    const GameFinder::Query query(find);
    if (query.isEmpty())
        return entries;
    QList<GameEntry> shown;
    for (GameEntry& entry : entries) {
        if (query.matches(GameFinder::MakeFindKey(entry.caption, entry.path)))
            shown.append(std::move(entry));
    }
    return shown;
}

void WriteCatalogue(
    const QList<GameEntry>& entries, Format format, const QHash<QString, PlayRecord>& history, QTextStream& out)
{
    if (format == Format::Text) {
        for (const GameEntry& entry : entries)
            out << entry.caption << '\t' << entry.path << '\n';
        return;
    }
    QJsonArray array;
    for (const GameEntry& entry : entries) {
        const PlayRecord played = history.value(PlayHistory::KeyFor(entry.path));
        array.append(QJsonObject {{QStringLiteral("caption"), entry.caption}, {QStringLiteral("path"), entry.path},
            {QStringLiteral("icon"), IconSourceName(entry.source)}, {QStringLiteral("launches"), played.launches},
            {QStringLiteral("playSeconds"), played.playSeconds},
            {QStringLiteral("lastPlayed"),
                played.lastPlayed.isValid() ? QJsonValue(played.lastPlayed.toUTC().toString(Qt::ISODate))
                                            : QJsonValue(QJsonValue::Null)}});
    }
    out << QString::fromUtf8(QJsonDocument(array).toJson(QJsonDocument::Indented));
}

int PrintCatalogue(const ListingOptions& options, QTextStream& out)
{
    LoadLanguageWithoutStoring();
    const QHash<QString, PlayRecord> history = PlayHistory::ReadAll();
    const QList<GameEntry> shown
        = ShownEntries(ListCatalogue(), options.find, options.order.value_or(ListOrders::Stored()), history);
    WriteCatalogue(shown, options.format, history, out);
    out.flush();
    return 0;
}

} // namespace Brimvault::CatalogueListing
