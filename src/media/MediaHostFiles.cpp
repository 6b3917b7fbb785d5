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
    return QFileInfo(RuffleHostPagePath()).isFile() && QFileInfo(RuffleScriptPath()).isFile();
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
    return QUrl::fromLocalFile(QFileInfo(path).absoluteFilePath());
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
