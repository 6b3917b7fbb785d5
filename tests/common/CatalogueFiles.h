#pragma once

#include <QByteArray>
#include <QString>

// Built executable fixtures for the catalogue tests.

// An executable with version texts built for the catalogue tests (<build>/testdata/catalogue), or the
// path where it would be: check it with REQUIRE_FIXTURE.
QString CatalogueFixture(const QString& name);
// A copy of a built fixture at path (parents made, an older file replaced); false when the fixture is missing.
bool CopyFixture(const QString& fixture, const QString& path);
// A valid icon file: the main icon of the PE fixture multi64.exe; empty when the fixture is missing.
QByteArray ValidIconFile();
