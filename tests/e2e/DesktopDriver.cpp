#include "DesktopDriver.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFileInfo>
#include <QHash>
#include <QRegularExpression>
#include <QTest>

namespace {

// xdotool waits this long between keys and typed characters, so that every event is handled in turn.
const QString KeyDelayMs = QStringLiteral("60");
constexpr int PollMs = 100;

} // namespace

DesktopDriver::DesktopDriver(const QString& helperProgram)
    : m_helper(helperProgram)
{ }

DesktopDriver::~DesktopDriver()
{
    m_xvfb.terminate();
    if (!m_xvfb.waitForFinished(5000)) {
        m_xvfb.kill();
        m_xvfb.waitForFinished(5000);
    }
}

QString DesktopDriver::start(int width, int height)
{
    // With -displayfd the server writes its display number to that descriptor once it is ready for clients.
    m_xvfb.start(QStringLiteral("Xvfb"),
        {QStringLiteral("-displayfd"), QStringLiteral("1"), QStringLiteral("-screen"), QStringLiteral("0"),
            QStringLiteral("%1x%2x24").arg(width).arg(height), QStringLiteral("-nolisten"), QStringLiteral("tcp"),
            QStringLiteral("-noreset")});
    if (!m_xvfb.waitForStarted(30000))
        return QStringLiteral("Xvfb did not start: ") + m_xvfb.errorString();
    static const QRegularExpression number(QStringLiteral("^(\\d+)\\n$"));
    QByteArray output;
    const QDeadlineTimer deadline(30000);
    while (!deadline.hasExpired() && m_xvfb.state() == QProcess::Running) {
        m_xvfb.waitForReadyRead(PollMs);
        output += m_xvfb.readAllStandardOutput();
        if (const QRegularExpressionMatch match = number.match(QString::fromLatin1(output)); match.hasMatch()) {
            m_display = u':' + match.captured(1);
            return {};
        }
    }
    return QStringLiteral("Xvfb gave no display number: ") + QString::fromLocal8Bit(m_xvfb.readAllStandardError());
}

QProcessEnvironment DesktopDriver::environment() const
{
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(QStringLiteral("DISPLAY"), m_display);
    environment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("xcb"));
    environment.remove(QStringLiteral("WAYLAND_DISPLAY"));
    return environment;
}

bool DesktopDriver::run(const QString& program, const QStringList& arguments, QString* output) const
{
    QProcess process;
    process.setProcessEnvironment(environment());
    process.start(program, arguments);
    const bool ended = process.waitForFinished(20000) && process.exitStatus() == QProcess::NormalExit;
    if (!ended) {
        process.kill();
        process.waitForFinished(5000);
    }
    if (output)
        *output = QString::fromUtf8(process.readAllStandardOutput());
    return ended && process.exitCode() == 0;
}

bool DesktopDriver::xdotool(const QStringList& arguments, QString* output) const
{
    return run(QStringLiteral("xdotool"), arguments, output);
}

QString DesktopDriver::ask(const QStringList& arguments) const
{
    QString output;
    xdotool(arguments, &output);
    return output.trimmed();
}

QList<qulonglong> DesktopDriver::windows(const QString& namePattern) const
{
    // No match is exit code 1 with empty output: an empty list, not a failure.
    const QStringList search = namePattern.isEmpty() ? QStringList {QStringLiteral("--class"), QStringLiteral(".*")}
                                                     : QStringList {QStringLiteral("--name"), namePattern};
    QList<qulonglong> windows;
    for (const QString& line : ask(QStringList {QStringLiteral("search"), QStringLiteral("--onlyvisible")} + search)
                                   .split(u'\n', Qt::SkipEmptyParts)) {
        bool ok = false;
        const qulonglong window = line.trimmed().toULongLong(&ok);
        if (ok)
            windows.append(window);
    }
    return windows;
}

qulonglong DesktopDriver::waitForWindow(
    const QString& namePattern, int timeoutMs, const QList<qulonglong>& except) const
{
    qulonglong found = 0;
    const bool shown = QTest::qWaitFor(
        [&] {
            for (qulonglong window : windows(namePattern)) {
                if (!except.contains(window) && !windowGeometry(window).isEmpty()) {
                    found = window;
                    break;
                }
            }
            return found != 0;
        },
        timeoutMs);
    return shown ? found : 0;
}

bool DesktopDriver::waitForWindowGone(qulonglong window, int timeoutMs) const
{
    return QTest::qWaitFor([&] { return !windows().contains(window); }, timeoutMs);
}

bool DesktopDriver::waitForFocus(qulonglong window, int timeoutMs) const
{
    return QTest::qWaitFor([&] { return ask({QStringLiteral("getwindowfocus")}).toULongLong() == window; }, timeoutMs);
}

QString DesktopDriver::windowName(qulonglong window) const
{
    return ask({QStringLiteral("getwindowname"), QString::number(window)});
}

qint64 DesktopDriver::windowProcess(qulonglong window) const
{
    return ask({QStringLiteral("getwindowpid"), QString::number(window)}).toLongLong();
}

QRect DesktopDriver::windowGeometry(qulonglong window) const
{
    QHash<QString, int> values;
    for (const QString& line :
        ask({QStringLiteral("getwindowgeometry"), QStringLiteral("--shell"), QString::number(window)}).split(u'\n')) {
        const qsizetype equals = line.indexOf(u'=');
        if (equals > 0)
            values.insert(line.left(equals), line.mid(equals + 1).toInt());
    }
    return {values.value(QStringLiteral("X")), values.value(QStringLiteral("Y")), values.value(QStringLiteral("WIDTH")),
        values.value(QStringLiteral("HEIGHT"))};
}

bool DesktopDriver::click(const QPoint& screen, int button) const
{
    return moveTo(screen)
        && xdotool({QStringLiteral("click"), QStringLiteral("--delay"), KeyDelayMs, QString::number(button)});
}

bool DesktopDriver::doubleClick(const QPoint& screen) const
{
    return moveTo(screen)
        && xdotool({QStringLiteral("click"), QStringLiteral("--repeat"), QStringLiteral("2"), QStringLiteral("--delay"),
            KeyDelayMs, QStringLiteral("1")});
}

bool DesktopDriver::moveTo(const QPoint& screen) const
{
    if (!xdotool({QStringLiteral("mousemove"), QString::number(screen.x()), QString::number(screen.y())}))
        return false;
    // The pointer's arrival is an event of its own; the next press must not overtake it.
    QTest::qWait(PollMs);
    return true;
}

bool DesktopDriver::keys(const QStringList& keyNames) const
{
    return xdotool(QStringList {QStringLiteral("key"), QStringLiteral("--delay"), KeyDelayMs} + keyNames);
}

bool DesktopDriver::typeText(const QString& text) const
{
    return xdotool({QStringLiteral("type"), QStringLiteral("--delay"), KeyDelayMs, text});
}

bool DesktopDriver::closeWindow(qulonglong window) const
{
    return run(m_helper, {QStringLiteral("close"), QString::number(window)});
}

QImage DesktopDriver::screenshot(const QString& pngPath) const
{
    QDir().mkpath(QFileInfo(pngPath).absolutePath());
    return run(m_helper, {QStringLiteral("grab"), pngPath}) ? QImage(pngPath) : QImage();
}
