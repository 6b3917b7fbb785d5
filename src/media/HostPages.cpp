#include "media/HostPages.h"

#include "media/frmReclama.h"
#include "store/SettingsStore.h"

#include <QCoreApplication>
#include <QDesktopServices>
#include <QDir>
#include <QWebEngineProfile>
#include <QWebEngineSettings>
#include <QWebEngineView>

namespace Brimvault {

namespace {

// Receives the address of a window a movie opened and hands it to the default browser.
class ExternalLinkPage : public QWebEnginePage {
public:
    explicit ExternalLinkPage(QObject* parent)
        : QWebEnginePage(MediaProfile(), parent)
    { }

protected:
    bool acceptNavigationRequest(const QUrl& url, NavigationType, bool) override
    {
        if (!url.isEmpty() && url.scheme() != u"about")
            QDesktopServices::openUrl(url);
        deleteLater();
        return false;
    }
};

} // namespace

QWebEngineProfile* MediaProfile()
{
    // Deliberately never deleted: pages of windows still open at exit must not outlive their profile.
    static QWebEngineProfile* profile = [] {
        const QString storage = QDir(SettingsDirectory()).filePath(QStringLiteral("web"));
#ifdef Q_OS_UNIX
        // A new profile writes its preferences below the data location before its storage path can be
        // set; keep even that inside our own folder.
        const QByteArray dataHome = qgetenv("XDG_DATA_HOME");
        const bool hadDataHome = qEnvironmentVariableIsSet("XDG_DATA_HOME");
        qputenv("XDG_DATA_HOME", QDir(storage).filePath(QStringLiteral("profile")).toLocal8Bit());
#endif
        auto* created = new QWebEngineProfile(QStringLiteral("Brimvault"));
#ifdef Q_OS_UNIX
        if (hadDataHome)
            qputenv("XDG_DATA_HOME", dataHome);
        else
            qunsetenv("XDG_DATA_HOME");
#endif
        created->setPersistentStoragePath(storage);
        created->setCachePath(QDir(storage).filePath(QStringLiteral("cache")));
        return created;
    }();
    return profile;
}

WebHostPage::WebHostPage(QObject* parent)
    : QWebEnginePage(MediaProfile(), parent)
{
    settings()->setAttribute(QWebEngineSettings::JavascriptCanOpenWindows, true);
    settings()->setAttribute(QWebEngineSettings::LocalContentCanAccessFileUrls, true);
    settings()->setAttribute(QWebEngineSettings::PlaybackRequiresUserGesture, false);
}

QWebEnginePage* WebHostPage::createWindow(WebWindowType type)
{
    Q_UNUSED(type);
    auto* window = new frmReclama();
    window->SetOnlineGamesCaption();
    QWebEngineView* browser = window->GetIE();
    if (!browser) {
        window->close();
        return nullptr;
    }
    QCoreApplication::processEvents();
    window->show();
    return browser->page();
}

void WebHostPage::javaScriptConsoleMessage(JavaScriptConsoleMessageLevel, const QString&, int, const QString&) { }

FlashHostPage::FlashHostPage(QObject* parent)
    : QWebEnginePage(MediaProfile(), parent)
{
    settings()->setAttribute(QWebEngineSettings::LocalContentCanAccessFileUrls, true);
    settings()->setAttribute(QWebEngineSettings::LocalContentCanAccessRemoteUrls, true);
    settings()->setAttribute(QWebEngineSettings::PlaybackRequiresUserGesture, false);
    settings()->setAttribute(QWebEngineSettings::JavascriptCanOpenWindows, true);
}

QWebEnginePage* FlashHostPage::createWindow(WebWindowType type)
{
    Q_UNUSED(type);
    return new ExternalLinkPage(this);
}

void FlashHostPage::javaScriptConsoleMessage(JavaScriptConsoleMessageLevel, const QString&, int, const QString&) { }

} // namespace Brimvault
