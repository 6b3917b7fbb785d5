#include "RuffleFixture.h"

#include <QDir>
#include <QFile>

QString MissingRuffle()
{
    const QDir ruffle(QStringLiteral(BRIMVAULT_BIN_DIR "/ruffle"));
    if (ruffle.exists(QStringLiteral("ruffle.js")) && !ruffle.entryList({QStringLiteral("*.wasm")}).isEmpty())
        return QString();
    return QStringLiteral("Ruffle is missing (ruffle.js or its *.wasm in %1): install the Debian packages nodejs and "
                          "npm, then run tools/install-ruffle.sh and build again; make test does all of this")
        .arg(ruffle.path());
}

bool CopyRuffleTo(const QString& folder)
{
    const QDir source(QStringLiteral(BRIMVAULT_BIN_DIR "/ruffle"));
    const QStringList files = source.entryList({QStringLiteral("*.js"), QStringLiteral("*.wasm")}, QDir::Files);
    bool copied = !files.isEmpty() && QDir().mkpath(folder + QStringLiteral("/ruffle"))
        && QFile::copy(
            QStringLiteral(BRIMVAULT_BIN_DIR "/ruffle-host.html"), folder + QStringLiteral("/ruffle-host.html"));
    for (const QString& name : files)
        copied = copied && QFile::copy(source.filePath(name), folder + QStringLiteral("/ruffle/") + name);
    return copied;
}
