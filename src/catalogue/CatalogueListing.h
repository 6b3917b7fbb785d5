#pragma once

#include "catalogue/GameEntry.h"

#include <QList>

class QTextStream;

// The catalogue without a window: what the list would show, in list order. Nothing is written, neither
// settings nor icon cache files.
namespace Brimvault::CatalogueListing {

enum class Format { Text, Json };

// The language in force as at start-up, without storing a first choice.
void LoadLanguageWithoutStoring();

QList<GameEntry> ListCatalogue();

// Tab-separated caption and path per line, or a JSON array of objects with "caption", "path" and "icon".
void WriteCatalogue(const QList<GameEntry>& entries, Format format, QTextStream& out);

// The "--list [--json]" command: 0.
int PrintCatalogue(Format format, QTextStream& out);

} // namespace Brimvault::CatalogueListing
