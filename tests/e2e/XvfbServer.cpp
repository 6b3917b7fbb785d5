#include "XvfbServer.h"

#include <QDeadlineTimer>
#include <QRegularExpression>

XvfbServer::~XvfbServer()
{
    stop();
}

QString XvfbServer::start(int width, int height, int timeoutMs)
{
    // With -displayfd the server writes its display number to that descriptor once it is ready for clients.
    m_process.setProgram(QStringLiteral("Xvfb"));
    m_process.setArguments({QStringLiteral("-displayfd"), QStringLiteral("1"), QStringLiteral("-screen"),
        QStringLiteral("0"), QStringLiteral("%1x%2x24").arg(width).arg(height), QStringLiteral("-nolisten"),
        QStringLiteral("tcp"), QStringLiteral("-noreset")});
    m_process.start();
    if (!m_process.waitForStarted(timeoutMs))
        return QStringLiteral("Xvfb did not start: ") + m_process.errorString();

    static const QRegularExpression number(QStringLiteral("^(\\d+)\\s*$"));
    QByteArray output;
    QDeadlineTimer deadline(timeoutMs);
    while (!deadline.hasExpired()) {
        if (m_process.state() != QProcess::Running)
            return QStringLiteral("Xvfb ended at once: ") + errorOutput();
        m_process.waitForReadyRead(100);
        output += m_process.readAllStandardOutput();
        const QRegularExpressionMatch match = number.match(QString::fromLatin1(output));
        if (match.hasMatch() && output.endsWith('\n')) {
            m_display = u':' + match.captured(1);
            return {};
        }
    }
    stop();
    return QStringLiteral("Xvfb gave no display number in time");
}

void XvfbServer::stop()
{
    if (m_process.state() == QProcess::NotRunning)
        return;
    m_process.terminate();
    if (!m_process.waitForFinished(5000)) {
        m_process.kill();
        m_process.waitForFinished(5000);
    }
}

QString XvfbServer::errorOutput()
{
    return QString::fromLocal8Bit(m_process.readAllStandardError());
}
