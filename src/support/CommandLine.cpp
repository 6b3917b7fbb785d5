#include "support/CommandLine.h"

#include "support/ProgramFolder.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>

#ifdef Q_OS_WIN
#include <qt_windows.h>
#endif

namespace Brimvault {

namespace {

bool isWindowsExecutable(const QString& path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) && file.read(2) == "MZ";
}

bool isStartable(const QFileInfo& info)
{
    if (!info.isFile())
        return false;
#ifdef Q_OS_WIN
    return true;
#else
    return info.isExecutable() || isWindowsExecutable(info.absoluteFilePath());
#endif
}

bool namesAFolderPath(const QString& name)
{
#ifdef Q_OS_WIN
    return name.contains(u'/') || name.contains(u'\\') || name.contains(u':');
#else
    return name.contains(u'/');
#endif
}

QStringList searchFolders()
{
    QStringList folders {ProgramFolder()};
    const QString path = qEnvironmentVariable("PATH");
    for (const QString& folder : path.split(QDir::listSeparator(), Qt::SkipEmptyParts))
        folders.append(folder);
    return folders;
}

QString findExactly(const QString& name)
{
    if (name.isEmpty())
        return QString();
    if (namesAFolderPath(name)) {
        const QFileInfo info(name);
        return isStartable(info) ? info.absoluteFilePath() : QString();
    }
    for (const QString& folder : searchFolders()) {
        const QFileInfo info(QDir(folder), name);
        if (isStartable(info))
            return info.absoluteFilePath();
    }
    return QString();
}

// What the platform would try for a name: Windows adds ".exe" to a name without extension; elsewhere our
// companion executables carry no ".exe".
QStringList nameVariants(const QString& name)
{
    QStringList variants {name};
    const QString suffix = QStringLiteral(".exe");
#ifdef Q_OS_WIN
    if (QFileInfo(name).suffix().isEmpty())
        variants.append(name + suffix);
#else
    if (name.endsWith(suffix, Qt::CaseInsensitive) && name.size() > suffix.size())
        variants.append(name.chopped(suffix.size()));
#endif
    return variants;
}

std::optional<ResolvedCommand> commandFor(
    const QString& program, QStringList arguments, const QString& compatibilityRunner)
{
#ifndef Q_OS_WIN
    if (isWindowsExecutable(program)) {
        std::optional<ResolvedCommand> runner;
        if (compatibilityRunner.trimmed().isEmpty()) {
            const QString wine = findExactly(QStringLiteral("wine"));
            if (!wine.isEmpty())
                runner = ResolvedCommand {wine, {}};
        } else {
            // The runner is resolved without one of its own, so a runner that is itself a Windows program can
            // only go through wine, never back to itself.
            runner = ResolveCommandLine(compatibilityRunner, QString());
        }
        if (!runner)
            return std::nullopt;
        runner->arguments.append(program);
        runner->arguments.append(arguments);
        return runner;
    }
#else
    Q_UNUSED(compatibilityRunner);
#endif
    return ResolvedCommand {program, arguments};
}

} // namespace

QString FindProgram(const QString& name)
{
    for (const QString& variant : nameVariants(name)) {
        const QString found = findExactly(variant);
        if (!found.isEmpty())
            return found;
    }
    return QString();
}

std::optional<ResolvedCommand> ResolveCommandLine(const QString& commandLine)
{
    return ResolveCommandLine(commandLine, QString());
}

std::optional<ResolvedCommand> ResolveCommandLine(const QString& commandLine, const QString& compatibilityRunner)
{
    const QString line = commandLine.trimmed();
    if (line.isEmpty())
        return std::nullopt;

    if (!line.startsWith(u'"')) {
        for (qsizetype blank = line.indexOf(u' '); blank > 0; blank = line.indexOf(u' ', blank + 1)) {
            const QString program = FindProgram(line.left(blank));
            if (!program.isEmpty())
                return commandFor(program, QProcess::splitCommand(line.mid(blank + 1)), compatibilityRunner);
        }
        const QString program = FindProgram(line);
        if (!program.isEmpty())
            return commandFor(program, {}, compatibilityRunner);
        return std::nullopt;
    }

    QStringList words = QProcess::splitCommand(line);
    if (words.isEmpty())
        return std::nullopt;
    const QString program = FindProgram(words.takeFirst());
    if (program.isEmpty())
        return std::nullopt;
    return commandFor(program, words, compatibilityRunner);
}

std::optional<qint64> StartCommandLine(const QString& commandLine, int windowStyle)
{
    return StartCommandLine(commandLine, windowStyle, QString());
}

std::optional<qint64> StartCommandLine(const QString& commandLine, int windowStyle, const QString& compatibilityRunner)
{
    const std::optional<ResolvedCommand> command = ResolveCommandLine(commandLine, compatibilityRunner);
    if (!command)
        return std::nullopt;
    QProcess process;
    process.setProgram(command->program);
    process.setArguments(command->arguments);
    process.setWorkingDirectory(QDir::currentPath());
#ifdef Q_OS_WIN
    process.setCreateProcessArgumentsModifier([windowStyle](QProcess::CreateProcessArguments* arguments) {
        arguments->startupInfo->dwFlags |= STARTF_USESHOWWINDOW;
        arguments->startupInfo->wShowWindow = static_cast<WORD>(windowStyle);
    });
#else
    Q_UNUSED(windowStyle);
    process.setStandardInputFile(QProcess::nullDevice());
#endif
    qint64 pid = 0;
    if (!process.startDetached(&pid) || pid <= 0)
        return std::nullopt;
    return pid;
}

} // namespace Brimvault
