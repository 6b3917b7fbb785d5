#include "media/MediaHostFiles.h"

#include "support/ProgramFolder.h"

#include <QCoreApplication>
#include <QDir>
#include <QFileInfo>
#include <QLibraryInfo>

namespace Brimvault::MediaHostFiles {

QString RuffleHostPagePath()
{
    return QDir(ProgramFolder()).filePath(QStringLiteral("ruffle-host.html"));
}

QString RuffleScriptPath()
{
    return QDir(ProgramFolder()).filePath(QStringLiteral("ruffle/ruffle.js"));
}

bool RuffleInstalled()
{
    if (!QFileInfo(RuffleHostPagePath()).isFile() || !QFileInfo(RuffleScriptPath()).isFile())
        return false;
    // Ruffle's script cannot start without its WebAssembly.
    const QDir ruffle = QFileInfo(RuffleScriptPath()).dir();
    return !ruffle.entryList({QStringLiteral("*.wasm")}, QDir::Files).isEmpty();
}

QUrl RuffleHostUrl(const QUrl& movie, const QString& catalogueRoot)
{
    QUrl url = QUrl::fromLocalFile(RuffleHostPagePath());
    url.setQuery(QStringLiteral("movie=") + QString::fromLatin1(QUrl::toPercentEncoding(movie.toString()))
        + QStringLiteral("&root=") + QString::fromLatin1(QUrl::toPercentEncoding(catalogueRoot)));
    return url;
}

QUrl ContentUrl(const QString& pathOrAddress)
{
    const QString text = pathOrAddress.trimmed();
    const QUrl asUrl(text, QUrl::StrictMode);
    // One-letter schemes are drive letters.
    if (asUrl.isValid() && asUrl.scheme().size() > 1)
        return asUrl;
    QString path = text;
#ifndef Q_OS_WIN
    path.replace(u'\\', u'/');
#endif
    const QFileInfo file(path);
    const bool drivePath = path.size() >= 2 && path.at(1) == u':' && path.at(0).isLetter();
    if (text.isEmpty() || file.isAbsolute() || drivePath || file.exists())
        return QUrl::fromLocalFile(file.absoluteFilePath());
    // What is neither a path nor an existing file is an address without its scheme ("www.example.com/offer"),
    // as the browser takes it.
    return QUrl::fromUserInput(text);
}

bool WebEngineAvailable()
{
#ifdef Q_OS_WIN
    const QString processName = QStringLiteral("QtWebEngineProcess.exe");
#else
    const QString processName = QStringLiteral("QtWebEngineProcess");
#endif
    if (qEnvironmentVariableIsSet("QTWEBENGINE_PROCESS_PATH"))
        return QFileInfo(qEnvironmentVariable("QTWEBENGINE_PROCESS_PATH")).isExecutable();
    const QString candidates[] = {
        QDir(QCoreApplication::applicationDirPath()).filePath(processName),
        QDir(QLibraryInfo::path(QLibraryInfo::LibraryExecutablesPath)).filePath(processName),
    };
    for (const QString& candidate : candidates) {
        if (QFileInfo(candidate).isExecutable())
            return true;
    }
    return false;
}

} // namespace Brimvault::MediaHostFiles
