#pragma once

#include <QWebEnginePage>

class QWebEngineProfile;

namespace Brimvault {

// The web profile of every media host window. Cookies and storage of online games persist in the
// settings folder, so that game progress survives and tests stay inside their temporary tree.
QWebEngineProfile* MediaProfile();

// The page of the embedded browser (oIE): a page that asks for a new window gets a new host window
// captioned "Online games".
class WebHostPage : public QWebEnginePage {
    Q_OBJECT

public:
    explicit WebHostPage(QObject* parent);

protected:
    QWebEnginePage* createWindow(WebWindowType type) override;
    void javaScriptConsoleMessage(
        JavaScriptConsoleMessageLevel level, const QString& message, int lineNumber, const QString& sourceId) override;
};

// The page that plays a Flash movie with Ruffle. Pages the movie opens go to the default browser.
class FlashHostPage : public QWebEnginePage {
    Q_OBJECT

public:
    explicit FlashHostPage(QObject* parent);

protected:
    QWebEnginePage* createWindow(WebWindowType type) override;
    void javaScriptConsoleMessage(
        JavaScriptConsoleMessageLevel level, const QString& message, int lineNumber, const QString& sourceId) override;
};

} // namespace Brimvault
