#include "ProgramRun.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "app/CompanionComponents.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QJsonArray>
#include <QJsonDocument>
#include <QProcess>

using namespace Brimvault;

QString ProgramPath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault");
}

QString ServicePath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService");
}

namespace {

bool copyInto(const QString& source, const QString& folder)
{
    const QString target = folder + u'/' + QFileInfo(source).fileName();
    return QFile::copy(source, target)
        && QFile::setPermissions(target, QFile::permissions(source) | QFileDevice::ReadOwner);
}

// Waits for the process, killing it after the time limit; true when it ended by itself.
bool finish(QProcess& process, int timeoutMs)
{
    if (process.waitForFinished(timeoutMs))
        return true;
    process.kill();
    process.waitForFinished(10000);
    return false;
}

} // namespace

ProgramFolderCopy::ProgramFolderCopy()
{
    if (!m_dir.isValid())
        return;
    m_valid = copyInto(ServicePath(), m_dir.path());
    for (const CompanionComponent& component : CompanionComponents())
        m_valid = m_valid && copyInto(QStringLiteral(BRIMVAULT_BIN_DIR "/") + component.fileName, m_dir.path());
    const QDir languages(QStringLiteral(BRIMVAULT_SOURCE_DIR "/lang"));
    for (const QString& name : languages.entryList({QStringLiteral("*.lng")}, QDir::Files))
        m_valid = m_valid && copyInto(languages.filePath(name), m_dir.path());
}

bool ProgramOutcome::showedWindow() const
{
    return finished && !crashed && exitCode == 0 && prompts.isEmpty() && window
        && window->value(QStringLiteral("visible")).toBool();
}

bool ProgramOutcome::stoppedWithAdminMessage() const
{
    if (!finished || crashed || exitCode != 1 || window || prompts.size() != 1)
        return false;
    const QJsonObject& box = prompts.first();
    return box.value(QStringLiteral("text")).toString()
        == QStringLiteral("You need to run the program as administrator!")
        && box.value(QStringLiteral("title")).toString() == QStringLiteral("Brimvault")
        && box.value(QStringLiteral("icon")).toString() == QStringLiteral("critical")
        && box.value(QStringLiteral("buttons")).toString() == QStringLiteral("ok");
}

QStringList ProgramOutcome::promptTexts() const
{
    QStringList texts;
    for (const QJsonObject& prompt : prompts)
        texts.append(prompt.value(QStringLiteral("text")).toString());
    return texts;
}

QStringList ProgramOutcome::items(const QString& field) const
{
    QStringList values;
    if (window) {
        for (const QJsonValue& item : window->value(QStringLiteral("items")).toArray())
            values.append(item.toObject().value(field).toString());
    }
    return values;
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

    QProcessEnvironment variables = QProcessEnvironment::systemEnvironment();
    variables.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    variables.insert(QStringLiteral("BRIMVAULT_PROGRAM_DIR"), programFolder);
    variables.insert(QStringLiteral("BRIMVAULT_LOCALE"), QStringLiteral("en_US"));
    variables.insert(QStringLiteral("BRIMVAULT_PROMPT_LOG"), promptLog);
    variables.insert(QStringLiteral("BRIMVAULT_WINDOW_REPORT"), windowReport);
    for (auto it = options.setEnvironment.cbegin(); it != options.setEnvironment.cend(); ++it)
        variables.insert(it.key(), it.value());
    for (const QString& name : options.unsetEnvironment)
        variables.remove(name);

    QProcess program;
    program.setProcessEnvironment(variables);
    program.setWorkingDirectory(environment.root());
    program.start(ProgramPath(), {});
    ProgramOutcome outcome;
    if (!program.waitForStarted(10000)) {
        outcome.standardError = program.errorString();
        return outcome;
    }
    outcome.finished = finish(program, options.timeoutMs);
    outcome.crashed = outcome.finished && program.exitStatus() == QProcess::CrashExit;
    outcome.exitCode = program.exitCode();
    outcome.standardError = QString::fromLocal8Bit(program.readAllStandardError());
    for (const QByteArray& line : ReadFile(promptLog).split('\n')) {
        if (!line.trimmed().isEmpty())
            outcome.prompts.append(QJsonDocument::fromJson(line).object());
    }
    if (QFileInfo::exists(windowReport))
        outcome.window = QJsonDocument::fromJson(ReadFile(windowReport)).object();
    return outcome;
}

int RunService(const QStringList& arguments, QString* output, int timeoutMs)
{
    QProcess service;
    QProcessEnvironment variables = QProcessEnvironment::systemEnvironment();
    variables.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    service.setProcessEnvironment(variables);
    service.setProcessChannelMode(QProcess::MergedChannels);
    service.start(ServicePath(), arguments);
    const bool ended = finish(service, timeoutMs) && service.exitStatus() == QProcess::NormalExit;
    if (output)
        *output = QString::fromLocal8Bit(service.readAll());
    return ended ? service.exitCode() : -1;
}
