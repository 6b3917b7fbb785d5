#pragma once

#include <QStringList>
#include <QTcpServer>

// A real HTTP/1.1 server on 127.0.0.1: every request is answered with `status` and the body "ok" (a redirect
// also names a Location), and each request target is recorded in `targets`, in order.
class LocalHttpServer : public QObject {
public:
    LocalHttpServer();

    bool isListening() const { return m_server.isListening(); }
    // "http://127.0.0.1:<port>", without a closing slash.
    QString root() const { return QStringLiteral("http://127.0.0.1:%1").arg(m_server.serverPort()); }

    int status = 200;
    QStringList targets;

private:
    QTcpServer m_server;
};
