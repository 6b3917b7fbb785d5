#include "RealPeFiles.h"

#include <QCryptographicHash>
#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QSet>

QStringList RealPeFiles(const QStringList& firstFolders, int maxFiles)
{
    QStringList roots = firstFolders;
    roots += qEnvironmentVariable("BRIMVAULT_PE_CORPUS").split(u':', Qt::SkipEmptyParts);
    roots += {QStringLiteral("/usr/lib/gcc/x86_64-w64-mingw32"), QStringLiteral("/usr/lib/gcc/i686-w64-mingw32"),
        QStringLiteral("/usr/x86_64-w64-mingw32/lib"), QStringLiteral("/usr/i686-w64-mingw32/lib"),
        QStringLiteral("/usr/lib/python3"), QStringLiteral("/usr/share/python-wheels"), QStringLiteral("/usr/lib/wine"),
        QStringLiteral("/usr/lib/x86_64-linux-gnu/wine"), QStringLiteral("/usr/share/wine"),
        QStringLiteral("/usr/lib/perf-core"), QStringLiteral("/usr/lib/google-cloud-sdk/platform"),
        QDir::homePath() + QStringLiteral("/.pyenv/versions")};
    QStringList files;
    QSet<QByteArray> seen;
    for (const QString& root : std::as_const(roots)) {
        QDirIterator it(
            root, {QStringLiteral("*.exe"), QStringLiteral("*.dll")}, QDir::Files, QDirIterator::Subdirectories);
        while (it.hasNext() && files.size() < maxFiles) {
            const QString path = it.next();
            QFile file(path);
            if (file.size() < 64 || !file.open(QIODevice::ReadOnly) || file.peek(2) != "MZ")
                continue;
            const QByteArray hash = QCryptographicHash::hash(file.readAll(), QCryptographicHash::Sha1);
            if (!seen.contains(hash)) {
                seen.insert(hash);
                files.append(path);
            }
        }
    }
    files.sort();
    return files;
}
