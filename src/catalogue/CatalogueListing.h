#pragma once

#include "catalogue/GameEntry.h"
#include "catalogue/ListOrder.h"

#include <QList>

class QTextStream;

// The catalogue without a window: what the list would show, in list order. Nothing is written, neither
// settings nor icon cache files.
namespace Brimvault::CatalogueListing {

enum class Format { Text, Json };

// The language in force as at start-up, without storing a first choice.
void LoadLanguageWithoutStoring();

QList<GameEntry> ListCatalogue();

// What the window shows for a typed text and an order.
struct ListingOptions {
    Format format = Format::Text;
    QString find;
    std::optional<ListOrder> order; // the stored order when not given
};

// Ordered as chosen, then narrowed to the games the text finds.
QList<GameEntry> ShownEntries(
    QList<GameEntry> entries, const QString& find, ListOrder order, const QHash<QString, PlayRecord>& history);

// Tab-separated caption and path per line, or a JSON array of objects with "caption", "path", "icon",
// "launches", "playSeconds" and "lastPlayed" (ISO 8601 or null).
void WriteCatalogue(
    const QList<GameEntry>& entries, Format format, const QHash<QString, PlayRecord>& history, QTextStream& out);

// The "--list [--json] [--find TEXT] [--order found|name|recent]" command: 0.
int PrintCatalogue(const ListingOptions& options, QTextStream& out);

} // namespace Brimvault::CatalogueListing
