#pragma once

#include <QImage>
#include <QList>
#include <QPoint>
#include <QProcess>
#include <QRect>
#include <QString>
#include <QStringList>

// A private X display, worked the way a person works a desktop: pointer and keyboard through xdotool, window
// lookups, and the desktop helper for screenshots, drags and closing windows by their close control.
class DesktopDriver {
public:
    explicit DesktopDriver(const QString& helperProgram);
    ~DesktopDriver();

    // Starts Xvfb on a display number it picks itself, so that runs beside each other never meet, and waits
    // until it accepts clients. Empty on success, else why it failed.
    QString start(int width, int height);
    // The calling process's environment with this display and the xcb platform.
    QProcessEnvironment environment() const;
    // Runs a program on the display; true when it ended with exit code 0.
    bool run(const QString& program, const QStringList& arguments, QString* output = nullptr) const;
    bool xdotool(const QStringList& arguments, QString* output = nullptr) const;

    // Visible windows whose name matches the pattern, in stacking order; with no pattern, every visible
    // window, pop-up menus without a name included.
    QList<qulonglong> windows(const QString& namePattern = {}) const;
    // Polls until a visible window matching the pattern and not in `except` shows; 0 when none did in time.
    qulonglong waitForWindow(const QString& namePattern, int timeoutMs, const QList<qulonglong>& except = {}) const;
    bool waitForWindowGone(qulonglong window, int timeoutMs) const;
    // Polls until the window has the keyboard focus, which a dialog takes a moment after it shows.
    bool waitForFocus(qulonglong window, int timeoutMs) const;
    QString windowName(qulonglong window) const;
    qint64 windowProcess(qulonglong window) const;
    QRect windowGeometry(qulonglong window) const;

    bool click(const QPoint& screen, int button = 1) const;
    bool doubleClick(const QPoint& screen) const;
    bool moveTo(const QPoint& screen) const;
    bool keys(const QStringList& keyNames) const;
    bool typeText(const QString& text) const;
    // Sends the window the message a window manager sends when its close button is clicked.
    bool closeWindow(qulonglong window) const;
    // Saves the whole screen as PNG and returns it; a null image when the grab failed.
    QImage screenshot(const QString& pngPath) const;
    QString helperProgram() const { return m_helper; }

private:
    QString ask(const QStringList& arguments) const;

    QProcess m_xvfb;
    QString m_display;
    QString m_helper;
};
