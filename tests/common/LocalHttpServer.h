#pragma once

#include <QByteArray>
#include <QHash>
#include <QStringList>
#include <QTcpServer>

class QTcpSocket;

// A real HTTP/1.1 server on 127.0.0.1: every request is answered with `status` and `body` (a redirect also
// names a Location), and each request target is recorded in `targets`, in order.
class LocalHttpServer : public QObject {
public:
    LocalHttpServer();

    bool isListening() const { return m_server.isListening(); }
    // "http://127.0.0.1:<port>", without a closing slash.
    QString root() const;

    int status = 200;
    QByteArray body = QByteArrayLiteral("ok");
    QStringList targets;

private:
    void answer(QTcpSocket* socket);

    QTcpServer m_server;
    QHash<QTcpSocket*, QByteArray> m_buffers;
};
