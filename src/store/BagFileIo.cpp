#include "store/BagFileIo.h"

#include "support/ReadOnlyFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QSaveFile>
#include <QStringDecoder>
#include <QStringEncoder>

namespace Brimvault::BagFileIo {

QString fileSystemPath(const QString& fileName)
{
#ifdef Q_OS_WIN
    return QDir::fromNativeSeparators(fileName);
#else
    QString path = fileName;
    path.replace(u'\\', u'/');
    return path;
#endif
}

bool isFile(const QString& fileName)
{
    return QFileInfo(fileSystemPath(fileName)).isFile();
}

ReadResult readText(const QString& fileName)
{
    ReadOnlyFile file(fileSystemPath(fileName));
    if (file.state() == ReadOnlyFile::State::Missing)
        return {};
    if (!file.isOpen() || file.size() > MaximumFileSize)
        return {ReadStatus::Unreadable, {}};
    // Asking for the largest size at once would allocate it for every small file; read what is there instead,
    // and keep reading in case the file grew since it was opened.
    QByteArray bytes = file.readAt(0, file.size() + 1);
    while (bytes.size() > file.size() && bytes.size() <= MaximumFileSize && !file.failed()) {
        const QByteArray more = file.readAt(bytes.size(), qMin<qint64>(MaximumFileSize + 1 - bytes.size(), 1 << 20));
        if (more.isEmpty())
            break;
        bytes += more;
    }
    if (file.failed() || bytes.size() > MaximumFileSize)
        return {ReadStatus::Unreadable, {}};
    QStringDecoder decoder(QStringConverter::System, QStringConverter::Flag::Stateless);
    return {ReadStatus::Read, decoder.decode(bytes)};
}

bool writeText(const QString& fileName, const QString& text)
{
    QStringEncoder encoder(QStringConverter::System);
    const QByteArray bytes = encoder.encode(text);
    QSaveFile file(fileSystemPath(fileName));
    if (!file.open(QIODevice::WriteOnly))
        return false;
    file.write(bytes);
    return file.commit();
}

bool removeFile(const QString& fileName)
{
    const QFileInfo info(fileSystemPath(fileName));
    if (!info.exists() && !info.isSymLink())
        return true;
    if (info.isDir())
        return false;
    return QFile::remove(info.filePath());
}

void createParentFolder(const QString& fileName)
{
    const QString path = fileSystemPath(fileName);
    const qsizetype separator = path.lastIndexOf(u'/');
    if (separator <= 0)
        return;
    const QString folder = path.left(separator);
    if (!QFileInfo::exists(folder))
        QDir().mkdir(folder);
}

} // namespace Brimvault::BagFileIo
