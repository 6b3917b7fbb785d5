#pragma once

#include <QByteArray>
#include <QList>
#include <QPair>
#include <QString>
#include <QStringList>

namespace Brimvault {
struct GameEntry;
}

// Real files in the temporary tree of a TestEnvironment.
namespace CatalogueTestTree {

// Creates the parent folders as needed.
bool writeFile(const QString& path, const QByteArray& bytes = QByteArrayLiteral("MZ"));
bool copyFile(const QString& from, const QString& to);
// A game info file with the given records ("Name", "Name_ENG", ...).
bool writeInfoFile(const QString& path, const QList<QPair<QString, QString>>& records);
bool writeStopMark(const QString& folder, const QString& value);

// Executables built for the tests; empty when the cross compiler was missing.
QString peFixture(const QString& name); // <build>/testdata/pe
QString catalogueFixture(const QString& name); // <build>/testdata/catalogue

// The main icon of an executable fixture as icon file bytes; empty when the fixture is missing.
QByteArray iconFileBytes();

QStringList captionsOf(const QList<Brimvault::GameEntry>& entries);
QStringList pathsOf(const QList<Brimvault::GameEntry>& entries);

// Every file below the folder with its bytes, to prove that nothing was written.
QList<QPair<QString, QByteArray>> snapshotTree(const QString& folder);

} // namespace CatalogueTestTree
