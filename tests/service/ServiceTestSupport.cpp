#include "ServiceTestSupport.h"

#include <QCryptographicHash>
#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QRandomGenerator>

namespace ServiceTestSupport {

QString servicePath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService");
}

void startService(QProcess& process, const QStringList& arguments)
{
    process.setProgram(servicePath());
    process.setArguments(arguments);
    process.start();
}

ServiceRun runService(const QStringList& arguments, int timeoutMs)
{
    QProcess process;
    startService(process, arguments);
    ServiceRun run;
    run.finished = process.waitForFinished(timeoutMs) && process.exitStatus() == QProcess::NormalExit;
    run.exitCode = process.exitCode();
    run.standardOutput = QString::fromLocal8Bit(process.readAllStandardOutput());
    run.standardError = QString::fromLocal8Bit(process.readAllStandardError());
    return run;
}

bool craftPackage(const QString& kind, const QString& out)
{
    QProcess python;
    python.start(
        QStringLiteral("python3"), {QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/service/craft_package.py"), kind, out});
    return python.waitForFinished(120000) && python.exitStatus() == QProcess::NormalExit && python.exitCode() == 0;
}

bool writeFile(const QString& path, const QByteArray& bytes)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.write(bytes) == bytes.size();
}

QByteArray randomBytes(qsizetype size, quint32 seed)
{
    QByteArray bytes(size, Qt::Uninitialized);
    QRandomGenerator generator(seed);
    const qsizetype words = size / qsizetype(sizeof(quint32));
    generator.fillRange(reinterpret_cast<quint32*>(bytes.data()), words);
    for (qsizetype i = words * qsizetype(sizeof(quint32)); i < size; ++i)
        bytes[i] = char(generator.generate());
    return bytes;
}

QStringList treeListing(const QString& root)
{
    QStringList lines;
    const QDir rootDir(root);
    QDirIterator it(
        root, QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QFileInfo info(it.next());
        const QString relative = rootDir.relativeFilePath(info.filePath());
        if (info.isSymLink()) {
            lines.append(relative + QStringLiteral(" -> ") + info.symLinkTarget());
        } else if (info.isDir()) {
            lines.append(relative + u'/');
        } else {
            QFile file(info.filePath());
            QCryptographicHash hash(QCryptographicHash::Sha1);
            if (file.open(QIODevice::ReadOnly))
                hash.addData(&file);
            lines.append(
                relative + u' ' + QString::number(info.size()) + u' ' + QString::fromLatin1(hash.result().toHex()));
        }
    }
    lines.sort();
    return lines;
}

} // namespace ServiceTestSupport
