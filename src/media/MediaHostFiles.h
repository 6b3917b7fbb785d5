#pragma once

#include <QString>
#include <QUrl>

namespace Brimvault::MediaHostFiles {

// Ruffle and our page that hosts it lie beside the program: ruffle-host.html, ruffle/ruffle.js and Ruffle's
// WebAssembly beside its script.
QString RuffleHostPagePath();
QString RuffleScriptPath();
bool RuffleInstalled();

// The host page playing `movie`, telling it the catalogue server's root for movies that ask for their
// page address.
QUrl RuffleHostUrl(const QUrl& movie, const QString& catalogueRoot);

// A movie or page given as a path or an address: addresses stay as they are, paths (also with "\") and
// existing files become file URLs, anything else is a web address without its scheme.
QUrl ContentUrl(const QString& pathOrAddress);

// Whether the web engine's helper process is where the engine will look for it.
bool WebEngineAvailable();

} // namespace Brimvault::MediaHostFiles
