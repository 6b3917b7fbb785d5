#include "LocalHttpServer.h"

#include <QTcpSocket>

LocalHttpServer::LocalHttpServer()
{
    m_server.listen(QHostAddress::LocalHost, 0);
    connect(&m_server, &QTcpServer::newConnection, this, [this] {
        while (QTcpSocket* socket = m_server.nextPendingConnection()) {
            connect(socket, &QTcpSocket::disconnected, socket, &QObject::deleteLater);
            connect(socket, &QTcpSocket::readyRead, this, [this, socket] {
                // The socket keeps what came so far until the whole header is in.
                if (!socket->peek(socket->bytesAvailable()).contains("\r\n\r\n"))
                    return;
                const QList<QByteArray> requestLine = socket->readLine().split(' ');
                socket->readAll();
                if (requestLine.size() >= 2)
                    targets.append(QString::fromLatin1(requestLine.at(1)));
                QByteArray response = "HTTP/1.1 " + QByteArray::number(status) + " Status\r\n";
                if (status == 301 || status == 302)
                    response += "Location: " + root().toLatin1() + "/elsewhere\r\n";
                socket->write(response + "Content-Length: 2\r\nConnection: close\r\n\r\nok");
                socket->disconnectFromHost();
            });
        }
    });
}
