#pragma once

#include <QList>
#include <QPair>
#include <QString>

// Catalogue files in a test's temporary tree; the parent folders are made as needed.

// A game info file with the given records ("Name", "Name_ENG", ...).
bool WriteInfoFile(const QString& path, const QList<QPair<QString, QString>>& records);
// The folder's stop mark ("StopDir") with the given value.
bool WriteStopMark(const QString& folder, const QString& value);
// An executable with version texts built for the catalogue tests (<build>/testdata/catalogue), or the
// path where it would be: check it with REQUIRE_FIXTURE.
QString CatalogueFixture(const QString& name);
// A copy of a built fixture at path (parents made, an older file replaced); false when the fixture is missing.
bool CopyFixture(const QString& fixture, const QString& path);
