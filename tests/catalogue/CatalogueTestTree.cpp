#include "CatalogueTestTree.h"

#include "catalogue/GameEntry.h"
#include "icons/cFileIcon.h"
#include "store/clsFileBag.h"

#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QFileInfo>

#include <algorithm>

namespace CatalogueTestTree {

bool writeFile(const QString& path, const QByteArray& bytes)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.write(bytes) == bytes.size();
}

bool copyFile(const QString& from, const QString& to)
{
    QDir().mkpath(QFileInfo(to).absolutePath());
    QFile::remove(to);
    return QFile::copy(from, to);
}

bool writeInfoFile(const QString& path, const QList<QPair<QString, QString>>& records)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    Brimvault::clsFileBag bag;
    for (const auto& [key, value] : records)
        bag.SetRecord(Brimvault::clsFileBag::MakeKey(key), value);
    bag.SetCurrentFileName(path);
    return bag.SaveFile();
}

bool writeStopMark(const QString& folder, const QString& value)
{
    return writeInfoFile(folder + QStringLiteral("/DirInfo.bvxinf"), {{QStringLiteral("StopDir"), value}});
}

QString peFixture(const QString& name)
{
    const QString path = QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe/") + name;
    return QFileInfo::exists(path) ? path : QString();
}

QString catalogueFixture(const QString& name)
{
    const QString path = QStringLiteral(CATALOGUE_FIXTURES_DIR "/") + name;
    return QFileInfo::exists(path) ? path : QString();
}

QByteArray iconFileBytes()
{
    const QString exe = peFixture(QStringLiteral("multi64.exe"));
    Brimvault::cFileIcon icon;
    if (exe.isEmpty() || !icon.LoadMainIconFromEXE(exe))
        return {};
    return icon.toIconFile();
}

QStringList captionsOf(const QList<Brimvault::GameEntry>& entries)
{
    QStringList captions;
    for (const auto& entry : entries)
        captions.append(entry.caption);
    return captions;
}

QStringList pathsOf(const QList<Brimvault::GameEntry>& entries)
{
    QStringList paths;
    for (const auto& entry : entries)
        paths.append(entry.path);
    return paths;
}

QList<QPair<QString, QByteArray>> snapshotTree(const QString& folder)
{
    QList<QPair<QString, QByteArray>> files;
    QDirIterator it(
        folder, QDir::AllEntries | QDir::NoDotAndDotDot | QDir::Hidden | QDir::System, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QString path = it.next();
        if (it.fileInfo().isDir()) {
            files.append({path, QByteArray("<folder>")});
            continue;
        }
        QFile file(path);
        files.append({path, file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray("<unreadable>")});
    }
    std::sort(files.begin(), files.end());
    return files;
}

} // namespace CatalogueTestTree
