#include "SmallFileSystem.h"

#include <QProcess>

namespace {

QString run(const QString& program, const QStringList& arguments)
{
    QProcess process;
    process.start(program, arguments);
    if (!process.waitForFinished(30000))
        return program + QStringLiteral(" did not finish: ") + process.errorString();
    if (process.exitStatus() != QProcess::NormalExit || process.exitCode() != 0)
        return program + QStringLiteral(" failed: ") + QString::fromLocal8Bit(process.readAllStandardError());
    return QString();
}

} // namespace

SmallFileSystem::SmallFileSystem(const QString& folder, const QString& options)
    : m_folder(folder)
{
    m_error = run(QStringLiteral("mount"),
        {QStringLiteral("-t"), QStringLiteral("tmpfs"), QStringLiteral("-o"), options, QStringLiteral("brimvault-test"),
            folder});
    m_mounted = m_error.isEmpty();
    if (!m_mounted)
        m_error
            = QStringLiteral("a tmpfs could not be mounted on %1 (the test must run as root): %2").arg(folder, m_error);
}

SmallFileSystem::~SmallFileSystem()
{
    if (m_mounted)
        run(QStringLiteral("umount"), {QStringLiteral("-l"), m_folder});
}
