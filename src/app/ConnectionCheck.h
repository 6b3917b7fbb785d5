#pragma once

#include <QString>
#include <memory>

class QNetworkAccessManager;

namespace Brimvault {

// Stands in for the system's XML HTTP request object: a synchronous request that reports the numeric
// status of the answer itself. Redirects are not followed, so a 302 is reported as 302.
class HttpRequest {
public:
    HttpRequest();
    ~HttpRequest();
    HttpRequest(const HttpRequest&) = delete;
    HttpRequest& operator=(const HttpRequest&) = delete;

    void Open(const QString& method, const QString& address, bool async = false);
    // Blocks until the answer arrives, the connection fails or TimeoutMs() passes; input events wait.
    // False when no answer arrived; Status() is then 0.
    bool Send();
    int Status() const { return m_status; }

    static int TimeoutMs();

private:
    std::unique_ptr<QNetworkAccessManager> m_manager;
    QString m_method;
    QString m_address;
    int m_status = 0;
};

// Nothing when no request can be made (no application object to run the network on).
std::unique_ptr<HttpRequest> CreateHttpRequest();

// The address the check asks: catalogue root + "/GetBrimvaultConnection.asp?rnd=" + random.
QString ConnectionCheckAddress(double random);

// True only when the catalogue server answered the check with status 200.
bool IsConnected();

} // namespace Brimvault
