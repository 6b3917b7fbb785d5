#pragma once

#include <QByteArray>
#include <QList>
#include <QString>
#include <QStringList>

#include <functional>
#include <optional>

// What the catalogue and window benchmarks share: the generated game libraries.
namespace Brimvault::BenchLibrary {

bool writeBytes(const QString& path, const QByteArray& bytes);

// Points every location of the program at root, then writes `installed` games into the games folder (each in
// its own folder with the executable, an info file and a cached icon) and `addedByHand` games recorded in
// the settings store.
// The executable and its main icon file that every generated game is made of; nothing when the PE fixture
// is missing (the reason goes to standard error).
struct GameFiles {
    QByteArray exe;
    QByteArray icon;
};
std::optional<GameFiles> loadGameFiles(const QString& peFixture);

// Library sizes given on the command line (for profiling one of them), else 1,000, 10,000 and 30,000.
QList<int> librarySizes(const QStringList& arguments);

bool makeLibrary(const QString& root, int installed, int addedByHand, const QByteArray& exe, const QByteArray& icon);

// Points every location of the program at a library made before.
void pointAt(const QString& root);

// For repeated runs and profiling: with BRIMVAULT_BENCH_LIBRARIES set, the library is made once in a folder of
// that name and used again by later runs; empty when the variable is not set or the library cannot be made.
QString reusableLibrary(int installed, int addedByHand, const QByteArray& exe, const QByteArray& icon);

} // namespace Brimvault::BenchLibrary
