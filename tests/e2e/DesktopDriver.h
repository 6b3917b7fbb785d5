#pragma once

#include <QImage>
#include <QList>
#include <QPoint>
#include <QProcessEnvironment>
#include <QRect>
#include <QString>
#include <QStringList>

// Works the test's X display the way a person works a desktop: pointer and keyboard through xdotool, window
// lookups, and the desktop helper for screenshots, drags and closing windows by their close control.
class DesktopDriver {
public:
    DesktopDriver(const QString& display, const QString& helperProgram);

    struct Result {
        bool finished = false;
        int exitCode = -1;
        QString output;
        QString errors;
        bool succeeded() const { return finished && exitCode == 0; }
    };

    // The calling process's environment with this display and the xcb platform.
    QProcessEnvironment environment() const;
    Result run(const QString& program, const QStringList& arguments, int timeoutMs = 20000) const;
    Result xdotool(const QStringList& arguments) const;

    // Visible windows whose name matches the pattern (a regular expression), in stacking order.
    QList<qulonglong> visibleWindows(const QString& namePattern) const;
    // Every visible window, pop-up menus without a name included.
    QList<qulonglong> allVisibleWindows() const;
    // Polls until a visible window matching the pattern and not in `except` shows; 0 when none did in time.
    qulonglong waitForWindow(const QString& namePattern, int timeoutMs, const QList<qulonglong>& except = {}) const;
    // Polls until the window is no longer visible.
    bool waitForWindowGone(qulonglong window, int timeoutMs) const;
    // Polls until the window has the keyboard focus, which a dialog takes a moment after it shows.
    bool waitForFocus(qulonglong window, int timeoutMs) const;
    QString windowName(qulonglong window) const;
    // The process that owns the window, 0 when it does not tell.
    qint64 windowProcess(qulonglong window) const;
    QRect windowGeometry(qulonglong window) const;

    bool click(const QPoint& screen, int button = 1) const;
    bool doubleClick(const QPoint& screen) const;
    bool moveTo(const QPoint& screen) const;
    bool pressButton(int button) const;
    bool releaseButton(int button) const;
    bool keys(const QStringList& keyNames) const;
    bool typeText(const QString& text) const;

    // Sends the window the message a window manager sends when its close button is clicked.
    bool closeWindow(qulonglong window) const;
    // Saves the whole screen as PNG and returns it; a null image when the grab failed.
    QImage screenshot(const QString& pngPath) const;
    QString helperProgram() const { return m_helper; }

private:
    QString m_display;
    QString m_helper;
};
