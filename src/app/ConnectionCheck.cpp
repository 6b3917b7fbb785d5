#include "app/ConnectionCheck.h"

#include "app/CatalogueServer.h"

#include <QCoreApplication>
#include <QEventLoop>
#include <QNetworkAccessManager>
#include <QNetworkProxyFactory>
#include <QNetworkReply>
#include <QNetworkRequest>
#include <QRandomGenerator>
#include <QTime>
#include <QTimer>

namespace Brimvault {

HttpRequest::HttpRequest()
    : m_manager(std::make_unique<QNetworkAccessManager>())
{ }

HttpRequest::~HttpRequest() = default;

int HttpRequest::TimeoutMs()
{
    return 15000;
}

void HttpRequest::Open(const QString& method, const QString& address, bool async)
{
    Q_UNUSED(async); // always synchronous, as the check needs it
    m_method = method;
    m_address = address;
    m_status = 0;
}

bool HttpRequest::Send()
{
    m_status = 0;
    const QUrl url(m_address);
    if (!url.isValid() || url.scheme().isEmpty())
        return false;

    const QList<QNetworkProxy> proxies = QNetworkProxyFactory::systemProxyForQuery(QNetworkProxyQuery(url));
    if (!proxies.isEmpty())
        m_manager->setProxy(proxies.constFirst());

    QNetworkRequest request(url);
    request.setAttribute(QNetworkRequest::RedirectPolicyAttribute, QNetworkRequest::ManualRedirectPolicy);
    request.setAttribute(QNetworkRequest::CacheLoadControlAttribute, QNetworkRequest::AlwaysNetwork);
    request.setTransferTimeout(TimeoutMs());

    QNetworkReply* reply = m_manager->sendCustomRequest(request, m_method.toLatin1());
    QEventLoop loop;
    QObject::connect(reply, &QNetworkReply::finished, &loop, &QEventLoop::quit);
    if (!reply->isFinished())
        loop.exec(QEventLoop::ExcludeUserInputEvents);

    const QVariant status = reply->attribute(QNetworkRequest::HttpStatusCodeAttribute);
    m_status = status.isValid() ? status.toInt() : 0;
    reply->deleteLater();
    return m_status != 0;
}

std::unique_ptr<HttpRequest> CreateHttpRequest()
{
    if (!QCoreApplication::instance())
        return nullptr;
    return std::make_unique<HttpRequest>();
}

QString ConnectionCheckAddress(double random)
{
    return CatalogueServerRoot() + QStringLiteral("/GetBrimvaultConnection.asp?rnd=") + QString::number(random, 'f', 7);
}

bool IsConnected()
{
    QRandomGenerator generator(static_cast<quint32>(QTime::currentTime().msecsSinceStartOfDay()));
    const QString address = ConnectionCheckAddress(generator.generateDouble());
    const std::unique_ptr<HttpRequest> request = CreateHttpRequest();
    if (!request)
        return false;
    request->Open(QStringLiteral("GET"), address, false);
    if (!request->Send())
        return false;
    return request->Status() == 200;
}

} // namespace Brimvault
