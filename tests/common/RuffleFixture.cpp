#include "RuffleFixture.h"

#include <QDir>
#include <QFile>

namespace {

QString builtRuffle()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/ruffle");
}

} // namespace

QString MissingRuffle()
{
    const QDir ruffle(builtRuffle());
    QString missing;
    if (!ruffle.exists(QStringLiteral("ruffle.js")))
        missing = QStringLiteral("ruffle.js");
    else if (ruffle.entryList({QStringLiteral("*.wasm")}, QDir::Files).isEmpty())
        missing = QStringLiteral("its WebAssembly (*.wasm)");
    else
        return QString();
    return QStringLiteral("Ruffle is missing (%1 in %2): install the Debian packages nodejs and npm, then run "
                          "tools/install-ruffle.sh and build again; make test does all of this")
        .arg(missing, ruffle.path());
}

bool CopyRuffleTo(const QString& folder)
{
    const QDir source(builtRuffle());
    if (!QDir().mkpath(folder + QStringLiteral("/ruffle")))
        return false;
    if (!QFile::copy(
            QStringLiteral(BRIMVAULT_BIN_DIR "/ruffle-host.html"), folder + QStringLiteral("/ruffle-host.html")))
        return false;
    const QStringList files = source.entryList({QStringLiteral("*.js"), QStringLiteral("*.wasm")}, QDir::Files);
    for (const QString& name : files) {
        if (!QFile::copy(source.filePath(name), folder + QStringLiteral("/ruffle/") + name))
            return false;
    }
    return !files.isEmpty();
}
