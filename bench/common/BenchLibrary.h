#pragma once

#include <QByteArray>
#include <QString>

#include <functional>

// What the catalogue and window benchmarks share: their output lines and the generated game libraries.
namespace Brimvault::BenchLibrary {

void figure(const QString& name, double value, const char* unit);
void ratio(const QString& name, double ours, double reference);
double medianMilliseconds(int runs, const std::function<void()>& work);
bool writeBytes(const QString& path, const QByteArray& bytes);

// Points every location of the program at root, then writes `installed` games into the games folder (each in
// its own folder with the executable, an info file and a cached icon) and `addedByHand` games recorded in
// the settings store.
bool makeLibrary(const QString& root, int installed, int addedByHand, const QByteArray& exe, const QByteArray& icon);

} // namespace Brimvault::BenchLibrary
