#pragma once

#include <QProcess>
#include <QString>

// A private X display for one test run: Xvfb picks a free display number and reports it, so that runs beside
// each other never meet.
class XvfbServer {
public:
    XvfbServer() = default;
    ~XvfbServer();
    XvfbServer(const XvfbServer&) = delete;
    XvfbServer& operator=(const XvfbServer&) = delete;

    // Starts the server and waits until it accepts clients. Empty on success, else why it failed.
    QString start(int width, int height, int timeoutMs);
    void stop();

    // ":N" once started.
    QString display() const { return m_display; }
    QString errorOutput();

private:
    QProcess m_process;
    QString m_display;
};
