#include "RuffleFixture.h"
#include "SwfBuilder.h"
#include "TestEnvironment.h"

#include "media/BrowserEmulation.h"
#include "media/ReclamaOnClose.h"
#include "media/ReclamaSchedule.h"
#include "media/WebEngineStartup.h"
#include "media/frmReclama.h"
#include "store/DataFolders.h"
#include "store/IniDocument.h"
#include "store/clsFileBag.h"
#include "support/UserPrompt.h"

#include <QApplication>
#include <QDesktopServices>
#include <QDir>
#include <QFile>
#include <QImage>
#include <QJsonDocument>
#include <QJsonObject>
#include <QPointer>
#include <QTest>
#include <QToolButton>
#include <QWebEnginePage>
#include <QWebEngineView>

using namespace Brimvault;

namespace {

constexpr int WebTimeout = 30000;

// Receives what the program hands to the default browser.
class UrlRecorder : public QObject {
    Q_OBJECT

public:
    QList<QUrl> urls;

public Q_SLOTS:
    void openUrl(const QUrl& url) { urls.append(url); }
};

QVariant evaluate(QWebEngineView* view, const QString& script)
{
    bool done = false;
    QVariant result;
    view->page()->runJavaScript(script, [&](const QVariant& value) {
        result = value;
        done = true;
    });
    if (!QTest::qWaitFor([&] { return done; }, WebTimeout))
        return QVariant();
    return result;
}

frmReclama* findWindowTitled(const QString& title)
{
    const QWidgetList windows = QApplication::topLevelWidgets();
    for (QWidget* window : windows) {
        auto* host = qobject_cast<frmReclama*>(window);
        if (host && host->windowTitle() == title && host->isVisible())
            return host;
    }
    return nullptr;
}

} // namespace

class tst_frmReclama : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;
    UrlRecorder m_browser;
    QList<PromptRequest> m_prompts;

    QString writeFile(const QString& name, const QByteArray& content)
    {
        const QString path = m_env.path(QStringLiteral("pages/") + name);
        QDir().mkpath(QFileInfo(path).absolutePath());
        QFile file(path);
        if (!file.open(QIODevice::WriteOnly))
            return QString();
        file.write(content);
        return path;
    }

    QString writePicture(const QString& name)
    {
        QImage picture(320, 200, QImage::Format_RGB32);
        picture.fill(QColor(40, 90, 160));
        const QString path = m_env.path(QStringLiteral("pages/") + name);
        QDir().mkpath(QFileInfo(path).absolutePath());
        return picture.save(path) ? path : QString();
    }

    static QString pageUrl(frmReclama* window)
    {
        return window && window->oIE() ? window->oIE()->url().fileName() : QString();
    }

    static QByteArray pageWithBody(const QByteArray& body)
    {
        return "<!DOCTYPE html><html><head><meta charset=\"utf-8\"><title>t</title></head><body>" + body
            + "</body></html>";
    }

private Q_SLOTS:
    void initTestCase()
    {
        qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR);
        SetPromptHandler([this](const PromptRequest& request) {
            m_prompts.append(request);
            return PromptAnswer::Ok;
        });
        QDesktopServices::setUrlHandler(QStringLiteral("http"), &m_browser, "openUrl");
        QDesktopServices::setUrlHandler(QStringLiteral("file"), &m_browser, "openUrl");
    }

    void cleanupTestCase()
    {
        QDesktopServices::unsetUrlHandler(QStringLiteral("http"));
        QDesktopServices::unsetUrlHandler(QStringLiteral("file"));
    }

    void init()
    {
        m_prompts.clear();
        m_browser.urls.clear();
    }

    void captionsAreLocalised()
    {
        QPointer<frmReclama> window = new frmReclama();
        QCOMPARE(window->windowTitle(), QStringLiteral("Advertising"));
        window->SetOnlineGamesCaption();
        QCOMPARE(window->windowTitle(), QStringLiteral("Online games"));
        QVERIFY(window->testAttribute(Qt::WA_DeleteOnClose));
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void webPageNavigatesAndGoesBack()
    {
        const QString second = writeFile(QStringLiteral("second.html"), pageWithBody("<p id=\"here\">second</p>"));
        const QString first = writeFile(QStringLiteral("first.html"),
            pageWithBody("<a id=\"next\" href=\"second.html\" style=\"position:fixed;left:0;top:0;width:300px;"
                         "height:200px;display:block\">next</a>"));
        QFile::remove(BrowserEmulationFile());

        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(first);
        QVERIFY(window->isVisible());
        QVERIFY(window->isMaximized());
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeWebPage));
        QVERIFY(window->oIE());
        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(window->oIE(), QStringLiteral("!!document.getElementById('next')")), QVariant(true), WebTimeout);
        QVERIFY(!window->pbGoBack()->isVisible());

        // The first page of a window writes both browser-emulation values.
        QFile emulation(BrowserEmulationFile());
        QVERIFY(emulation.open(QIODevice::ReadOnly));
        const IniDocument values = IniDocument::parse(emulation.readAll());
        emulation.close();
        for (const char* key : {"HKEY_CURRENT_USER\\SOFTWARE\\Microsoft\\Internet "
                                "Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION",
                 "HKEY_CURRENT_USER\\SOFTWARE\\Wow6432Node\\Microsoft\\Internet "
                 "Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"})
            QCOMPARE(values.value(QString::fromLatin1(key), QStringLiteral("Brimvault.exe")).value_or(QString()),
                QStringLiteral("dword:00000000"));

        // A real click: the engine lets only pages the user left on purpose be returned to.
        QVERIFY(QTest::qWaitForWindowExposed(window));
        QWidget* content = window->oIE()->focusProxy();
        QVERIFY(content);
        QTest::mouseClick(content, Qt::LeftButton, {}, QPoint(100, 80));
        QTRY_COMPARE_WITH_TIMEOUT(pageUrl(window), QStringLiteral("second.html"), WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(window->pbGoBack()->isVisible() && window->pbGoBack()->isEnabled(), WebTimeout);
        QVERIFY(window->oIE()->geometry().top() >= window->pbGoBack()->geometry().bottom());

        QTest::mouseClick(window->pbGoBack(), Qt::LeftButton);
        QTRY_COMPARE_WITH_TIMEOUT(pageUrl(window), QStringLiteral("first.html"), WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(!window->pbGoBack()->isVisible(), WebTimeout);
        QCOMPARE(window->oIE()->geometry(), window->rect());

        // Later pages in the same window leave the values alone.
        QVERIFY(QFile::remove(BrowserEmulationFile()));
        QVERIFY(window->LoadHTML(second));
        QTRY_COMPARE_WITH_TIMEOUT(pageUrl(window), QStringLiteral("second.html"), WebTimeout);
        QVERIFY(!QFile::exists(BrowserEmulationFile()));

        window->close();
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_prompts.isEmpty());
    }

    void newWindowOpensOnlineGamesWindow()
    {
        writeFile(QStringLiteral("popup.html"), pageWithBody("<p id=\"popup\">popup</p>"));
        const QString opener = writeFile(QStringLiteral("opener.html"),
            pageWithBody("<script>window.addEventListener('load', () => { window.opened = "
                         "!!window.open('popup.html', '_blank', 'width=500,height=400'); });</script>"));

        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(opener);
        QTRY_VERIFY_WITH_TIMEOUT(findWindowTitled(QStringLiteral("Online games")), WebTimeout);
        QPointer<frmReclama> popup = findWindowTitled(QStringLiteral("Online games"));
        QVERIFY(popup != window);
        QCOMPARE(popup->DisplayModeValue(), int(frmReclama::ModeWebPage));
        QTRY_COMPARE_WITH_TIMEOUT(pageUrl(popup), QStringLiteral("popup.html"), WebTimeout);
        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(window->oIE(), QStringLiteral("!!window.opened")), QVariant(true), WebTimeout);

        popup->close();
        window->close();
        QTRY_VERIFY(popup.isNull() && window.isNull());
    }

    void pageClosingItselfClosesTheWindow()
    {
        const QString page = writeFile(QStringLiteral("closing.html"),
            pageWithBody("<script>window.addEventListener('load', () => setTimeout(() => window.close(), 100));"
                         "</script>"));
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(page);
        QVERIFY(window->isVisible());
        QTRY_VERIFY_WITH_TIMEOUT(window.isNull(), WebTimeout);
    }

    void stillPictureClickThrough_data()
    {
        QTest::addColumn<QString>("address");
        QTest::addColumn<QString>("opened");
        QTest::newRow("with address") << "http://ads.example/offer"
                                      << "http://ads.example/offer";
        QTest::newRow("address with blanks") << "  http://ads.example/offer "
                                             << "http://ads.example/offer";
        QTest::newRow("empty address") << ""
                                       << "";
        QTest::newRow("blank address") << "   "
                                       << "";
    }

    void stillPictureClickThrough()
    {
        QFETCH(QString, address);
        QFETCH(QString, opened);
        const QString picture = writePicture(QStringLiteral("Image_offer.png"));
        QVERIFY(!picture.isEmpty());

        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(picture, address);
        QVERIFY(window->isVisible());
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeStillPicture));
        QCOMPARE(window->size(), frmReclama::HostClientSize());
        QCOMPARE(window->cursor().shape(), Qt::PointingHandCursor);
        QVERIFY(!window->oIE() && !window->oFlash());
        QVERIFY(QTest::qWaitForWindowExposed(window));

        // The space around the picture takes its colour from the picture.
        const QImage shown = window->grab().toImage();
        QCOMPARE(shown.pixelColor(320, 240), QColor(40, 90, 160));
        QCOMPARE(shown.pixelColor(2, 2), QColor(40, 90, 160));

        QTest::mouseClick(window, Qt::LeftButton, {}, QPoint(320, 240));
        QTRY_VERIFY(window.isNull());
        QCOMPARE(m_browser.urls.size(), opened.isEmpty() ? 0 : 1);
        if (!opened.isEmpty())
            QCOMPARE(m_browser.urls.constFirst(), QUrl(opened));
    }

    void unreadablePictureUnloadsQuietly()
    {
        const QString broken = writeFile(QStringLiteral("Image_broken.png"), "not a picture at all");
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(broken, QStringLiteral("http://ads.example/"));
        QVERIFY(window.isNull() || !window->isVisible());
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_prompts.isEmpty());
        QVERIFY(m_browser.urls.isEmpty());
    }

    void webPageAdvertisement_data()
    {
        QTest::addColumn<QString>("address");
        QTest::addColumn<QString>("shown");
        QTest::newRow("the file when the address is empty") << ""
                                                            << "Image_page.html";
        QTest::newRow("the file when the address is blank") << "  "
                                                            << "Image_page.html";
        QTest::newRow("the address otherwise") << "landing.html"
                                               << "landing.html";
    }

    void webPageAdvertisement()
    {
        QFETCH(QString, address);
        QFETCH(QString, shown);
        const QString advertisement = writeFile(QStringLiteral("Image_page.html"), pageWithBody("ad"));
        const QString landing = writeFile(QStringLiteral("landing.html"), pageWithBody("landing"));
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(advertisement, address.isEmpty() || address.trimmed().isEmpty() ? address : landing);
        QVERIFY(window->isVisible());
        QCOMPARE(window->size(), frmReclama::HostClientSize());
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeWebPage));
        QCOMPARE(window->cursor().shape(), Qt::ArrowCursor);
        QTRY_COMPARE_WITH_TIMEOUT(pageUrl(window), shown, WebTimeout);
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void dueAdvertisementShowsOnClose_data()
    {
        QTest::addColumn<int>("mode");
        QTest::addColumn<bool>("shown");
        QTest::newRow("closed by the user") << int(ReclamaSchedule::UnloadMode::FormControlMenu) << true;
        QTest::newRow("closed by the program") << int(ReclamaSchedule::UnloadMode::FormCode) << true;
        QTest::newRow("system shutdown") << int(ReclamaSchedule::UnloadMode::AppWindows) << false;
    }

    void dueAdvertisementShowsOnClose()
    {
        QFETCH(int, mode);
        QFETCH(bool, shown);
        const QString folder = DataFolders::ReclamaFolder();
        QVERIFY(folder.startsWith(m_env.root()));
        QDir().mkpath(folder);
        QImage picture(200, 100, QImage::Format_RGB32);
        picture.fill(Qt::darkGreen);
        QVERIFY(picture.save(QDir(folder).filePath(QStringLiteral("Image_close.png"))));
        clsFileBag bag;
        bag.SetCurrentFileName(QDir(folder).filePath(QStringLiteral("Reclama.ifb")));
        bag.SetRecord(clsFileBag::MakeKey(QStringLiteral("image_close"), QStringLiteral("URL")),
            QStringLiteral("http://ads.example/close"));
        bag.SetRecord(clsFileBag::MakeKey(QStringLiteral("image_close"), QStringLiteral("DateShowFrom")),
            QStringLiteral("X.X.X"));
        bag.SetRecord(
            clsFileBag::MakeKey(QStringLiteral("image_close"), QStringLiteral("DateShowTo")), QStringLiteral("X.X.X"));
        QVERIFY(bag.SaveFile());

        QCOMPARE(ShowDueReclama(static_cast<ReclamaSchedule::UnloadMode>(mode)), shown);
        QPointer<frmReclama> window = findWindowTitled(QStringLiteral("Advertising"));
        QCOMPARE(!window.isNull(), shown);
        if (!window)
            return;
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeStillPicture));
        QCOMPARE(window->ClickAddress(), QStringLiteral("http://ads.example/close"));
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void flashMovieIsPlayedByRuffle()
    {
        REQUIRE_RUFFLE();
        SwfBuilder movie(8, 550, 400, 24.0);
        movie.setBackgroundColor(0x12, 0x34, 0x56);
        // The movie asks for its page address and hands the answer back to the page.
        const QByteArray ask = SwfBuilder::push({QStringLiteral("window.location.href.toString"), 1})
            + SwfBuilder::externalInterface() + SwfBuilder::callMethod(QStringLiteral("call"));
        const QByteArray echo = SwfBuilder::push({QStringLiteral("brimvaultEcho"), 2}) + SwfBuilder::externalInterface()
            + SwfBuilder::callMethod(QStringLiteral("call")) + SwfBuilder::pop();
        movie.doAction(ask + echo);
        movie.showFrame();
        const QString path = writeFile(QStringLiteral("game with blanks.swf"), movie.bytes());

        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(path, QStringLiteral("Generated Game"));
        QVERIFY(window->isVisible());
        QCOMPARE(window->windowTitle(), QStringLiteral("Generated Game"));
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeFlashMovie));
        QCOMPARE(window->size(), frmReclama::HostClientSize());
        QVERIFY(window->oFlash());
        QCOMPARE(window->oFlash()->geometry(), window->rect());

        QVariant metadata;
        QTRY_VERIFY_WITH_TIMEOUT(
            (metadata = evaluate(window->oFlash(), QStringLiteral("JSON.stringify(window.brimvault.metadata)")))
                .toString()
                .contains(u"swfVersion"),
            WebTimeout);
        const QJsonObject info = QJsonDocument::fromJson(metadata.toString().toUtf8()).object();
        QCOMPARE(info.value(u"width").toInt(), 550);
        QCOMPARE(info.value(u"height").toInt(), 400);
        QCOMPARE(info.value(u"frameRate").toDouble(), 24.0);
        QCOMPARE(info.value(u"numFrames").toInt(), 1);
        QCOMPARE(info.value(u"swfVersion").toInt(), 8);
        QCOMPARE(info.value(u"backgroundColor").toString().toLower(), QStringLiteral("#123456"));

        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(
                window->oFlash(), QStringLiteral("JSON.stringify(window.brimvault.calls.map(c => [c.name, c.args]))"))
                .toString(),
            QStringLiteral("[[\"window.location.href.toString\",[]],[\"brimvaultEcho\",[\"http://127.0.0.1:9\"]]]"),
            WebTimeout);
        QVERIFY(m_prompts.isEmpty());

        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void movieOpeningAPageHandsItToTheBrowser()
    {
        REQUIRE_RUFFLE();
        SwfBuilder movie(8, 100, 100, 12.0);
        movie.doAction(SwfBuilder::getUrl("http://127.0.0.1:9/more-games", "_blank"));
        movie.showFrame();
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(writeFile(QStringLiteral("opener.swf"), movie.bytes()));
        QTRY_COMPARE_WITH_TIMEOUT(
            m_browser.urls, QList<QUrl> {QUrl(QStringLiteral("http://127.0.0.1:9/more-games"))}, WebTimeout);
        QVERIFY(!findWindowTitled(QStringLiteral("Online games")));
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void animatedPictureAdvertisementPlays()
    {
        // Two 1 x 1 frames, red then blue, 0.1 s each, looping.
        QByteArray gif("GIF89a");
        gif += QByteArray::fromHex("010001008001"
                                   "00"
                                   "ff0000"
                                   "0000ff");
        gif += QByteArray::fromHex("21ff0b") + "NETSCAPE2.0"
            + QByteArray::fromHex("03010000"
                                  "00");
        for (const char* pixel : {"44", "4c"}) {
            gif += QByteArray::fromHex("21f904"
                                       "000a00"
                                       "00"
                                       "00");
            gif += QByteArray::fromHex("2c"
                                       "00000000"
                                       "01000100"
                                       "00");
            gif += QByteArray::fromHex("0202") + QByteArray::fromHex(pixel) + QByteArray::fromHex("0100");
        }
        gif += QByteArray::fromHex("3b");
        const QString path = writeFile(QStringLiteral("Image_blink.gif"), gif);

        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(path, QString());
        QVERIFY(window->isVisible());
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeStillPicture));
        const auto centre = [&] { return window->grab().toImage().pixelColor(319, 239); };
        QTRY_COMPARE_WITH_TIMEOUT(centre(), QColor(Qt::blue), 5000);
        QTRY_COMPARE_WITH_TIMEOUT(centre(), QColor(Qt::red), 5000);

        QTest::keyClick(window, Qt::Key_Escape);
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_browser.urls.isEmpty());
    }

    void missingRuffleGivesItsMessage()
    {
        const QString empty = m_env.path(QStringLiteral("program-without-ruffle"));
        QDir().mkpath(empty);
        qputenv("BRIMVAULT_PROGRAM_DIR", empty.toLocal8Bit());
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(writeFile(QStringLiteral("any.swf"), SwfBuilder(8, 10, 10, 1).bytes()));
        qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR);

        QCOMPARE(m_prompts.size(), 1);
        QCOMPARE(
            m_prompts.constFirst().text, QStringLiteral("Macromedia Shockwave Flash Control not installed properly."));
        QCOMPARE(m_prompts.constFirst().icon, PromptIcon::Critical);
        QTRY_VERIFY(window.isNull());
    }

    void missingWebEngineGivesItsMessage()
    {
        qputenv("QTWEBENGINE_PROCESS_PATH", m_env.path(QStringLiteral("no-such-process")).toLocal8Bit());
        QPointer<frmReclama> window = new frmReclama();
        const bool loaded = window->LoadHTML(QStringLiteral("http://127.0.0.1:9/page.html"));
        QWebEngineView* browser = window->GetIE();
        const QString page = writeFile(QStringLiteral("fallback.html"), pageWithBody("x"));
        QPointer<frmReclama> launcher = new frmReclama();
        launcher->RunGame(page);
        qunsetenv("QTWEBENGINE_PROCESS_PATH");

        QVERIFY(!loaded);
        QVERIFY(!browser);
        QCOMPARE(window->DisplayModeValue(), int(frmReclama::ModeNothing));
        QCOMPARE(m_prompts.size(), 1);
        QCOMPARE(m_prompts.constFirst().text, QStringLiteral("Internet Explorer Control not installed properly."));
        QCOMPARE(m_prompts.constFirst().icon, PromptIcon::Critical);
        // The launcher hands a page it cannot show to the default browser.
        QCOMPARE(m_browser.urls, QList<QUrl> {QUrl::fromLocalFile(page)});
        QTRY_VERIFY(launcher.isNull());
        window->close();
        QTRY_VERIFY(window.isNull());
    }
};

int main(int argc, char* argv[])
{
    PrepareWebEngine();
    QApplication app(argc, argv);
    tst_frmReclama test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_frmreclama.moc"
