#pragma once

#include <QByteArray>
#include <QHostAddress>
#include <QStringList>
#include <QTcpServer>
#include <QTcpSocket>

// A tiny HTTP/1.1 server on 127.0.0.1 for tests: every request is answered with the status set in
// `status`, and its request target is recorded.
class LocalHttpServer : public QObject {
public:
    LocalHttpServer()
    {
        m_server.listen(QHostAddress::LocalHost, 0);
        QObject::connect(&m_server, &QTcpServer::newConnection, this, [this] {
            while (QTcpSocket* socket = m_server.nextPendingConnection())
                QObject::connect(socket, &QTcpSocket::readyRead, this, [this, socket] { answer(socket); });
        });
    }

    bool isListening() const { return m_server.isListening(); }
    QString root() const { return QStringLiteral("http://127.0.0.1:%1").arg(m_server.serverPort()); }

    int status = 200;
    QStringList targets;

private:
    void answer(QTcpSocket* socket)
    {
        QByteArray& buffer = m_buffers[socket];
        buffer += socket->readAll();
        if (!buffer.contains("\r\n\r\n"))
            return;
        const QList<QByteArray> requestLine = buffer.left(buffer.indexOf("\r\n")).split(' ');
        m_buffers.remove(socket);
        if (requestLine.size() >= 2)
            targets.append(QString::fromLatin1(requestLine.at(1)));

        const QByteArray body = "ok";
        QByteArray response = "HTTP/1.1 " + QByteArray::number(status) + " Status\r\n";
        if (status == 301 || status == 302)
            response += "Location: " + root().toLatin1() + "/elsewhere\r\n";
        if (status != 304)
            response += "Content-Length: " + QByteArray::number(body.size()) + "\r\n";
        response += "Connection: close\r\n\r\n";
        if (status != 304)
            response += body;
        socket->write(response);
        socket->disconnectFromHost();
        QObject::connect(socket, &QTcpSocket::disconnected, socket, &QObject::deleteLater);
    }

    QTcpServer m_server;
    QHash<QTcpSocket*, QByteArray> m_buffers;
};
