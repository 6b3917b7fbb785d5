#include "DesktopDriver.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFileInfo>
#include <QHash>
#include <QProcess>
#include <QTest>

namespace {

// xdotool waits this long between keys and typed characters, so that every event is handled in turn.
constexpr char KeyDelayMs[] = "60";
constexpr int PollMs = 100;

} // namespace

DesktopDriver::DesktopDriver(const QString& display, const QString& helperProgram)
    : m_display(display)
    , m_helper(helperProgram)
{ }

QProcessEnvironment DesktopDriver::environment() const
{
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(QStringLiteral("DISPLAY"), m_display);
    environment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("xcb"));
    environment.remove(QStringLiteral("WAYLAND_DISPLAY"));
    return environment;
}

DesktopDriver::Result DesktopDriver::run(const QString& program, const QStringList& arguments, int timeoutMs) const
{
    QProcess process;
    process.setProcessEnvironment(environment());
    process.start(program, arguments);
    Result result;
    result.finished = process.waitForFinished(timeoutMs) && process.exitStatus() == QProcess::NormalExit;
    if (process.state() != QProcess::NotRunning) {
        process.kill();
        process.waitForFinished(5000);
    }
    result.exitCode = process.exitCode();
    result.output = QString::fromUtf8(process.readAllStandardOutput());
    result.errors = QString::fromLocal8Bit(process.readAllStandardError());
    return result;
}

DesktopDriver::Result DesktopDriver::xdotool(const QStringList& arguments) const
{
    return run(QStringLiteral("xdotool"), arguments);
}

namespace {

QList<qulonglong> windowIds(const QString& output)
{
    QList<qulonglong> windows;
    for (const QString& line : output.split(u'\n', Qt::SkipEmptyParts)) {
        bool ok = false;
        const qulonglong window = line.trimmed().toULongLong(&ok);
        if (ok)
            windows.append(window);
    }
    return windows;
}

} // namespace

QList<qulonglong> DesktopDriver::visibleWindows(const QString& namePattern) const
{
    // No match is exit code 1 with empty output: an empty list, not a failure.
    return windowIds(
        xdotool({QStringLiteral("search"), QStringLiteral("--onlyvisible"), QStringLiteral("--name"), namePattern})
            .output);
}

QList<qulonglong> DesktopDriver::allVisibleWindows() const
{
    return windowIds(xdotool(
        {QStringLiteral("search"), QStringLiteral("--onlyvisible"), QStringLiteral("--class"), QStringLiteral(".*")})
                         .output);
}

qulonglong DesktopDriver::waitForWindow(
    const QString& namePattern, int timeoutMs, const QList<qulonglong>& except) const
{
    QDeadlineTimer deadline(timeoutMs);
    do {
        for (qulonglong window : visibleWindows(namePattern)) {
            if (!except.contains(window) && !windowGeometry(window).isEmpty())
                return window;
        }
        QTest::qWait(PollMs);
    } while (!deadline.hasExpired());
    return 0;
}

bool DesktopDriver::waitForWindowGone(qulonglong window, int timeoutMs) const
{
    QDeadlineTimer deadline(timeoutMs);
    do {
        if (!allVisibleWindows().contains(window))
            return true;
        QTest::qWait(PollMs);
    } while (!deadline.hasExpired());
    return false;
}

bool DesktopDriver::waitForFocus(qulonglong window, int timeoutMs) const
{
    QDeadlineTimer deadline(timeoutMs);
    do {
        if (xdotool({QStringLiteral("getwindowfocus")}).output.trimmed().toULongLong() == window)
            return true;
        QTest::qWait(PollMs);
    } while (!deadline.hasExpired());
    return false;
}

QString DesktopDriver::windowName(qulonglong window) const
{
    return xdotool({QStringLiteral("getwindowname"), QString::number(window)}).output.trimmed();
}

qint64 DesktopDriver::windowProcess(qulonglong window) const
{
    return xdotool({QStringLiteral("getwindowpid"), QString::number(window)}).output.trimmed().toLongLong();
}

QRect DesktopDriver::windowGeometry(qulonglong window) const
{
    const Result shell
        = xdotool({QStringLiteral("getwindowgeometry"), QStringLiteral("--shell"), QString::number(window)});
    if (!shell.succeeded())
        return {};
    QHash<QString, int> values;
    for (const QString& line : shell.output.split(u'\n', Qt::SkipEmptyParts)) {
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
        && xdotool(
            {QStringLiteral("click"), QStringLiteral("--delay"), QLatin1String(KeyDelayMs), QString::number(button)})
               .succeeded();
}

bool DesktopDriver::doubleClick(const QPoint& screen) const
{
    return moveTo(screen)
        && xdotool({QStringLiteral("click"), QStringLiteral("--repeat"), QStringLiteral("2"), QStringLiteral("--delay"),
                       QLatin1String(KeyDelayMs), QStringLiteral("1")})
               .succeeded();
}

bool DesktopDriver::moveTo(const QPoint& screen) const
{
    if (!xdotool({QStringLiteral("mousemove"), QString::number(screen.x()), QString::number(screen.y())}).succeeded())
        return false;
    // The pointer's arrival is an event of its own; the next press must not overtake it.
    QTest::qWait(PollMs);
    return true;
}

bool DesktopDriver::pressButton(int button) const
{
    return xdotool({QStringLiteral("mousedown"), QString::number(button)}).succeeded();
}

bool DesktopDriver::releaseButton(int button) const
{
    return xdotool({QStringLiteral("mouseup"), QString::number(button)}).succeeded();
}

bool DesktopDriver::keys(const QStringList& keyNames) const
{
    return xdotool(QStringList {QStringLiteral("key"), QStringLiteral("--delay"), QLatin1String(KeyDelayMs)} + keyNames)
        .succeeded();
}

bool DesktopDriver::typeText(const QString& text) const
{
    return xdotool({QStringLiteral("type"), QStringLiteral("--delay"), QLatin1String(KeyDelayMs), text}).succeeded();
}

bool DesktopDriver::closeWindow(qulonglong window) const
{
    return run(m_helper, {QStringLiteral("close"), QString::number(window)}).succeeded();
}

QImage DesktopDriver::screenshot(const QString& pngPath) const
{
    QDir().mkpath(QFileInfo(pngPath).absolutePath());
    if (!run(m_helper, {QStringLiteral("grab"), pngPath}).succeeded())
        return {};
    return QImage(pngPath);
}
