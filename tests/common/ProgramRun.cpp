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
using namespace Qt::StringLiterals;

namespace {

bool copyInto(const QString& source, const QString& folder)
{
    const QString target = folder + u'/' + QFileInfo(source).fileName();
    return QFile::copy(source, target)
        && QFile::setPermissions(target, QFile::permissions(source) | QFileDevice::ReadOwner);
}

// Waits a minute for the process, then kills it; true when it ended by itself.
bool finish(QProcess& process)
{
    if (process.waitForFinished(60000))
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
    for (const QString& name : languages.entryList({u"*.lng"_s}, QDir::Files))
        m_valid = m_valid && copyInto(languages.filePath(name), m_dir.path());
}

bool ProgramOutcome::showedWindow() const
{
    return finished && !crashed && exitCode == 0 && prompts.isEmpty() && window && window->value(u"visible"_s).toBool();
}

bool ProgramOutcome::stoppedWithAdminMessage() const
{
    const QJsonObject message {{u"kind"_s, u"message"_s},
        {u"text"_s, u"You need to run the program as administrator!"_s}, {u"title"_s, u"Brimvault"_s},
        {u"icon"_s, u"critical"_s}, {u"buttons"_s, u"ok"_s}};
    return finished && !crashed && exitCode == 1 && !window && prompts == QList {message};
}

QStringList ProgramOutcome::items(const QString& field) const
{
    QStringList values;
    if (window) {
        for (const QJsonValue& item : window->value(u"items"_s).toArray())
            values.append(item.toObject().value(field).toString());
    }
    return values;
}

QString ProgramOutcome::describe() const
{
    QStringList texts;
    for (const QJsonObject& prompt : prompts)
        texts.append(prompt.value(u"text"_s).toString());
    const QByteArray shown = window ? QJsonDocument(*window).toJson(QJsonDocument::Compact) : "-";
    return u"exit=%1 finished=%2 crashed=%3\nprompts: %4\nwindow: %5\nstderr: %6"_s.arg(exitCode)
        .arg(finished)
        .arg(crashed)
        .arg(texts.join(u" | "_s), QString::fromUtf8(shown), standardError.right(2000));
}

ProgramOutcome RunProgram(
    const TestEnvironment& environment, const QString& programFolder, const QMap<QString, QString>& changes)
{
    const QString promptLog = environment.path(u"prompts.jsonl"_s);
    const QString windowReport = environment.path(u"window.json"_s);
    QFile::remove(promptLog);
    QFile::remove(windowReport);
    QMap<QString, QString> variables {{u"QT_QPA_PLATFORM"_s, u"offscreen"_s}, {u"BRIMVAULT_LOCALE"_s, u"en_US"_s},
        {u"BRIMVAULT_PROGRAM_DIR"_s, programFolder.isEmpty() ? QString() : programFolder},
        {u"BRIMVAULT_PROMPT_LOG"_s, promptLog}, {u"BRIMVAULT_WINDOW_REPORT"_s, windowReport}};
    variables.insert(changes);
    QProcessEnvironment system = QProcessEnvironment::systemEnvironment();
    for (auto it = variables.cbegin(); it != variables.cend(); ++it)
        it->isNull() ? system.remove(it.key()) : system.insert(it.key(), it.value());

    QProcess program;
    program.setProcessEnvironment(system);
    program.setWorkingDirectory(environment.root());
    program.start(ProgramPath(), {});
    ProgramOutcome outcome;
    outcome.finished = finish(program);
    outcome.crashed = outcome.finished && program.exitStatus() == QProcess::CrashExit;
    outcome.exitCode = program.exitCode();
    outcome.standardError = program.errorString() + u'\n' + QString::fromLocal8Bit(program.readAllStandardError());
    for (const QByteArray& line : ReadFile(promptLog).split('\n')) {
        if (!line.trimmed().isEmpty())
            outcome.prompts.append(QJsonDocument::fromJson(line).object());
    }
    if (QFileInfo::exists(windowReport))
        outcome.window = QJsonDocument::fromJson(ReadFile(windowReport)).object();
    return outcome;
}

int RunService(const QStringList& arguments, QString* output)
{
    QProcess service;
    QProcessEnvironment variables = QProcessEnvironment::systemEnvironment();
    variables.insert(u"QT_QPA_PLATFORM"_s, u"offscreen"_s);
    service.setProcessEnvironment(variables);
    service.setProcessChannelMode(QProcess::MergedChannels);
    service.start(ServicePath(), arguments);
    const bool ended = finish(service) && service.exitStatus() == QProcess::NormalExit;
    if (output)
        *output = QString::fromLocal8Bit(service.readAll());
    return ended ? service.exitCode() : -1;
}
