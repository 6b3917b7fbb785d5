#include "ProgramRun.h"

#include "TestEnvironment.h"
#include "app/CompanionComponents.h"

#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QFileInfo>
#include <QJsonArray>
#include <QJsonDocument>
#include <QProcess>

#ifdef Q_OS_UNIX
#include <sys/stat.h>
#endif

using namespace Brimvault;

namespace {

const QString binDir = QStringLiteral(BRIMVAULT_BIN_DIR);

bool copyInto(const QString& source, const QString& folder)
{
    const QString target = folder + u'/' + QFileInfo(source).fileName();
    return QFile::copy(source, target)
        && QFile::setPermissions(target, QFile::permissions(source) | QFileDevice::ReadOwner);
}

QList<QJsonObject> readPromptLog(const QString& path)
{
    QList<QJsonObject> prompts;
    const QList<QByteArray> lines = ReadBytes(path).split('\n');
    for (const QByteArray& line : lines) {
        if (!line.trimmed().isEmpty())
            prompts.append(QJsonDocument::fromJson(line).object());
    }
    return prompts;
}

} // namespace

ProgramFolderCopy::ProgramFolderCopy()
{
    if (!m_dir.isValid())
        return;
    m_valid = copyInto(binDir + QStringLiteral("/BrimvaultService"), m_dir.path());
    for (const CompanionComponent& component : CompanionComponents())
        m_valid = m_valid && copyInto(binDir + u'/' + component.fileName, m_dir.path());
    const QDir languages(QStringLiteral(BRIMVAULT_SOURCE_DIR "/lang"));
    for (const QString& name : languages.entryList({QStringLiteral("*.lng")}, QDir::Files))
        m_valid = m_valid && copyInto(languages.filePath(name), m_dir.path());
}

QStringList ProgramOutcome::promptTexts() const
{
    QStringList texts;
    for (const QJsonObject& prompt : prompts)
        texts.append(prompt.value(QStringLiteral("text")).toString());
    return texts;
}

QStringList ProgramOutcome::captions() const
{
    QStringList captions;
    if (window) {
        for (const QJsonValue& item : window->value(QStringLiteral("items")).toArray())
            captions.append(item.toObject().value(QStringLiteral("caption")).toString());
    }
    return captions;
}

QStringList ProgramOutcome::itemData() const
{
    QStringList data;
    if (window) {
        for (const QJsonValue& item : window->value(QStringLiteral("items")).toArray())
            data.append(item.toObject().value(QStringLiteral("data")).toString());
    }
    return data;
}

QString ProgramOutcome::pictureOf(const QString& data) const
{
    if (window) {
        for (const QJsonValue& item : window->value(QStringLiteral("items")).toArray()) {
            if (item.toObject().value(QStringLiteral("data")).toString() == data)
                return item.toObject().value(QStringLiteral("picture")).toString();
        }
    }
    return QString();
}

QString ProgramOutcome::describe() const
{
    return QStringLiteral("finished=%1 crashed=%2 exit=%3\nprompts: %4\nwindow: %5\nstderr: %6")
        .arg(finished)
        .arg(crashed)
        .arg(exitCode)
        .arg(promptTexts().join(QStringLiteral(" | ")),
            window ? QString::fromUtf8(QJsonDocument(*window).toJson(QJsonDocument::Compact)) : QStringLiteral("-"),
            standardError.right(2000));
}

ProgramOutcome RunProgram(
    const TestEnvironment& environment, const QString& programFolder, const ProgramRunOptions& options)
{
    const QString promptLog = environment.path(QStringLiteral("prompts.jsonl"));
    const QString windowReport = environment.path(QStringLiteral("window.json"));
    QFile::remove(promptLog);
    QFile::remove(windowReport);

    QProcessEnvironment processEnvironment = QProcessEnvironment::systemEnvironment();
    processEnvironment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    processEnvironment.insert(QStringLiteral("BRIMVAULT_PROGRAM_DIR"), programFolder);
    processEnvironment.insert(QStringLiteral("BRIMVAULT_LOCALE"), QStringLiteral("en_US"));
    processEnvironment.insert(QStringLiteral("BRIMVAULT_PROMPT_LOG"), promptLog);
    processEnvironment.insert(QStringLiteral("BRIMVAULT_WINDOW_REPORT"), windowReport);
    for (auto it = options.setEnvironment.cbegin(); it != options.setEnvironment.cend(); ++it)
        processEnvironment.insert(it.key(), it.value());
    for (const QString& name : options.unsetEnvironment)
        processEnvironment.remove(name);

    QProcess program;
    program.setProcessEnvironment(processEnvironment);
    program.setWorkingDirectory(environment.root());
    program.start(binDir + QStringLiteral("/brimvault"), {});

    ProgramOutcome outcome;
    if (!program.waitForStarted(10000)) {
        outcome.standardError = program.errorString();
        return outcome;
    }
    outcome.finished = program.waitForFinished(options.timeoutMs);
    if (!outcome.finished) {
        program.kill();
        program.waitForFinished(10000);
    }
    outcome.crashed = outcome.finished && program.exitStatus() == QProcess::CrashExit;
    outcome.exitCode = program.exitCode();
    outcome.standardError = QString::fromLocal8Bit(program.readAllStandardError());
    outcome.prompts = readPromptLog(promptLog);
    if (QFileInfo::exists(windowReport))
        outcome.window = QJsonDocument::fromJson(ReadBytes(windowReport)).object();
    return outcome;
}

int RunService(const QStringList& arguments, QString* output, int timeoutMs)
{
    QProcess service;
    QProcessEnvironment processEnvironment = QProcessEnvironment::systemEnvironment();
    processEnvironment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    service.setProcessEnvironment(processEnvironment);
    service.setProcessChannelMode(QProcess::MergedChannels);
    service.start(binDir + QStringLiteral("/BrimvaultService"), arguments);
    const bool finished = service.waitForFinished(timeoutMs) && service.exitStatus() == QProcess::NormalExit;
    if (!finished) {
        service.kill();
        service.waitForFinished(10000);
    }
    if (output)
        *output = QString::fromLocal8Bit(service.readAll());
    return finished ? service.exitCode() : -1;
}

QMap<QString, QByteArray> SnapshotTree(const QString& root)
{
    QMap<QString, QByteArray> tree;
    const auto describeEntry = [](const QFileInfo& info) -> QByteArray {
        if (info.isSymLink())
            return "<link>" + QFile::encodeName(info.symLinkTarget());
        if (info.isDir())
            return "<dir>";
        if (!info.isFile())
            return info.exists() ? QByteArray("<fifo>") : QByteArray("<missing>");
        return ReadBytes(info.filePath());
    };
    tree.insert(QStringLiteral("."), describeEntry(QFileInfo(root)));
    if (!QFileInfo(root).isDir() || QFileInfo(root).isSymLink())
        return tree;
    QDirIterator it(
        root, QDir::AllEntries | QDir::System | QDir::Hidden | QDir::NoDotAndDotDot, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        it.next();
        tree.insert(QDir(root).relativeFilePath(it.filePath()), describeEntry(it.fileInfo()));
    }
    return tree;
}

bool MakeNamedPipe(const QString& path)
{
#ifdef Q_OS_UNIX
    return ::mkfifo(QFile::encodeName(path).constData(), 0600) == 0;
#else
    Q_UNUSED(path);
    return false;
#endif
}

bool WriteBytes(const QString& path, const QByteArray& bytes)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    return file.open(QIODevice::WriteOnly | QIODevice::Truncate) && file.write(bytes) == bytes.size();
}

QByteArray ReadBytes(const QString& path)
{
    if (!QFileInfo(path).isFile())
        return QByteArray();
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}
