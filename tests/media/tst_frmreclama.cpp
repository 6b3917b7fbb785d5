// The media host window with the real web engine: pages, still pictures and Flash movies played by Ruffle.
#include "AdvertisingFiles.h"
#include "MovieFiles.h"
#include "PromptRecorder.h"
#include "RuffleFixture.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "UrlCatcher.h"

#include "media/BrowserEmulation.h"
#include "media/ReclamaOnClose.h"
#include "media/ReclamaSchedule.h"
#include "media/WebEngineStartup.h"
#include "media/frmReclama.h"
#include "store/DataFolders.h"

#include <QApplication>
#include <QDir>
#include <QPointer>
#include <QTest>
#include <QToolButton>
#include <QWebEnginePage>
#include <QWebEngineView>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

constexpr int WebTimeout = 30000;

// What a script evaluates to in the view, read back as text.
QString evaluate(QWebEngineView* view, const QString& script)
{
    std::optional<QString> result;
    view->page()->runJavaScript(script, [&](const QVariant& value) { result = value.toString(); });
    return QTest::qWaitFor([&] { return result.has_value(); }, WebTimeout) ? *result : u"<no answer>"_s;
}

QString pageOf(frmReclama* window)
{
    return window && window->oIE() ? window->oIE()->url().fileName() : QString();
}

frmReclama* shownWindowTitled(const QString& title)
{
    for (QWidget* window : QApplication::topLevelWidgets()) {
        auto* host = qobject_cast<frmReclama*>(window);
        if (host && host->windowTitle() == title && host->isVisible())
            return host;
    }
    return nullptr;
}

} // namespace

class tst_frmReclama : public QObject {
    Q_OBJECT

    TestEnvironment m_env;
    std::unique_ptr<PromptRecorder> m_prompts;
    std::unique_ptr<UrlCatcher> m_browser;

    QString page(const QString& name, const QByteArray& body)
    {
        const QString path = m_env.path(u"pages/"_s + name);
        WriteFile(path, "<!DOCTYPE html><html><head><meta charset=\"utf-8\"></head><body>" + body + "</body></html>");
        return path;
    }
    QString file(const QString& name, const QByteArray& bytes)
    {
        const QString path = m_env.path(u"pages/"_s + name);
        return WriteFile(path, bytes) ? path : QString();
    }

private Q_SLOTS:
    void initTestCase() { qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR); }
    void init()
    {
        m_prompts = std::make_unique<PromptRecorder>(PromptAnswer::Ok);
        m_browser = std::make_unique<UrlCatcher>();
    }
    void cleanup()
    {
        m_browser.reset();
        m_prompts.reset();
    }

    void webPageNavigatesAndGoesBack()
    {
        const QString second = page(u"second.html"_s, "<p>second</p>");
        const QString first = page(u"first.html"_s,
            "<a id=\"next\" href=\"second.html\" style=\"position:fixed;left:0;top:0;width:300px;height:200px;"
            "display:block\">next</a>");
        QFile::remove(BrowserEmulationFile());
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(first);
        QVERIFY(window->isVisible() && window->isMaximized());
        QCOMPARE(window->DisplayModeValue(), 3);
        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(window->oIE(), u"!!document.getElementById('next')"_s), u"true"_s, WebTimeout);
        QVERIFY(!window->pbGoBack()->isVisible());

        // The first page of a window writes the browser-emulation values.
        QVERIFY(QFile::exists(BrowserEmulationFile()));

        // A real click: the engine lets only pages the user left on purpose be returned to.
        QVERIFY(QTest::qWaitForWindowExposed(window));
        QTest::mouseClick(window->oIE()->focusProxy(), Qt::LeftButton, {}, QPoint(100, 80));
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(window), u"second.html"_s, WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(window->pbGoBack()->isVisible() && window->pbGoBack()->isEnabled(), WebTimeout);
        QVERIFY(window->oIE()->geometry().top() >= window->pbGoBack()->geometry().bottom());
        QTest::mouseClick(window->pbGoBack(), Qt::LeftButton);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(window), u"first.html"_s, WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(!window->pbGoBack()->isVisible(), WebTimeout);
        QCOMPARE(window->oIE()->geometry(), window->rect());

        // Later pages in the same window leave the values alone.
        QVERIFY(QFile::remove(BrowserEmulationFile()));
        QVERIFY(window->LoadHTML(second));
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(window), u"second.html"_s, WebTimeout);
        QVERIFY(!QFile::exists(BrowserEmulationFile()));
        window->close();
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_prompts->prompts.isEmpty());
    }

    void newWindowOpensOnlineGamesWindow()
    {
        page(u"popup.html"_s, "popup");
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(page(u"opener.html"_s,
            "<script>window.addEventListener('load', () => { window.opened = !!window.open('popup.html', '_blank', "
            "'width=500,height=400'); });</script>"));
        QTRY_VERIFY_WITH_TIMEOUT(shownWindowTitled(u"Online games"_s), WebTimeout);
        QPointer<frmReclama> popup = shownWindowTitled(u"Online games"_s);
        QVERIFY(popup != window);
        QCOMPARE(popup->DisplayModeValue(), 3);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(popup), u"popup.html"_s, WebTimeout);
        QTRY_COMPARE_WITH_TIMEOUT(evaluate(window->oIE(), u"!!window.opened"_s), u"true"_s, WebTimeout);
        popup->close();
        window->close();
        QTRY_VERIFY(popup.isNull() && window.isNull());
    }

    void pageClosingItselfClosesTheWindow()
    {
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(page(u"closing.html"_s,
            "<script>window.addEventListener('load', () => setTimeout(() => window.close(), 100));</script>"));
        QVERIFY(window->isVisible());
        QTRY_VERIFY_WITH_TIMEOUT(window.isNull(), WebTimeout);
    }

    void stillPictureClickThrough_data()
    {
        QTest::addColumn<QString>("address");
        QTest::addColumn<QList<QUrl>>("opened");
        QTest::newRow("address with blanks")
            << u"  http://ads.example/offer "_s << QList<QUrl> {QUrl(u"http://ads.example/offer"_s)};
        QTest::newRow("blank address opens nothing") << u"   "_s << QList<QUrl>();
    }
    void stillPictureClickThrough()
    {
        QFETCH(QString, address);
        QFETCH(QList<QUrl>, opened);
        const QString picture = m_env.path(u"pages/Image_offer.png"_s);
        QVERIFY(WritePicture(picture, QColor(40, 90, 160), QSize(320, 200)));
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(picture, address);
        QVERIFY(window->isVisible());
        QCOMPARE(window->DisplayModeValue(), 1);
        QCOMPARE(window->size(), QSize(640, 480));
        QCOMPARE(window->cursor().shape(), Qt::PointingHandCursor);
        QVERIFY(QTest::qWaitForWindowExposed(window));
        // The space around the picture takes its colour from the picture.
        const QImage shown = window->grab().toImage();
        QCOMPARE(shown.pixelColor(320, 240), QColor(40, 90, 160));
        QCOMPARE(shown.pixelColor(2, 2), QColor(40, 90, 160));

        QTest::mouseClick(window, Qt::LeftButton, {}, QPoint(320, 240));
        QTRY_VERIFY(window.isNull());
        QCOMPARE(m_browser->opened, opened);
    }

    void unreadablePictureUnloadsQuietly()
    {
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(file(u"Image_broken.png"_s, "not a picture at all"), u"http://ads.example/"_s);
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_prompts->prompts.isEmpty() && m_browser->opened.isEmpty());
    }

    void webPageAdvertisement_data()
    {
        QTest::addColumn<QString>("address");
        QTest::addColumn<QString>("shown");
        QTest::newRow("the file when the address is blank") << u"  "_s << u"Image_page.html"_s;
        QTest::newRow("the address otherwise") << u"landing.html"_s << u"landing.html"_s;
    }
    void webPageAdvertisement()
    {
        QFETCH(QString, address);
        QFETCH(QString, shown);
        const QString landing = page(u"landing.html"_s, "landing");
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(page(u"Image_page.html"_s, "ad"), address.trimmed().isEmpty() ? address : landing);
        QVERIFY(window->isVisible());
        QCOMPARE(window->size(), QSize(640, 480));
        QCOMPARE(window->DisplayModeValue(), 3);
        QCOMPARE(window->cursor().shape(), Qt::ArrowCursor);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(window), shown, WebTimeout);
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void dueAdvertisementShowsOnClose()
    {
        QVERIFY(WriteDueAdvertisement(DataFolders::ReclamaFolder(), u"http://ads.example/close"_s, Qt::darkGreen));
        QVERIFY(ShowDueReclama(ReclamaSchedule::UnloadMode::FormControlMenu));
        QPointer<frmReclama> window = shownWindowTitled(u"Advertising"_s);
        QVERIFY(window);
        QCOMPARE(window->DisplayModeValue(), 1);
        QCOMPARE(window->ClickAddress(), u"http://ads.example/close"_s);
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void flashMovieIsPlayedByRuffle()
    {
        REQUIRE_RUFFLE();
        SwfBuilder movie(8, 550, 400, 24.0);
        // The movie asks for its page address and hands the answer back to the page.
        movie.doAction(SwfBuilder::externalCall(u"window.location.href.toString"_s)
            + SwfBuilder::externalCall(u"brimvaultEcho"_s, 1) + SwfBuilder::pop());
        movie.showFrame();
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(file(u"game with blanks.swf"_s, movie.bytes()), u"Generated Game"_s);
        QVERIFY(window->isVisible());
        QCOMPARE(window->windowTitle(), u"Generated Game"_s);
        QCOMPARE(window->DisplayModeValue(), 2);
        QCOMPARE(window->size(), QSize(640, 480));
        QCOMPARE(window->oFlash()->geometry(), window->rect());

        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(window->oFlash(), u"JSON.stringify(window.brimvault.calls.map(c => [c.name, c.args]))"_s),
            u"[[\"window.location.href.toString\",[]],[\"brimvaultEcho\",[\"http://127.0.0.1:9\"]]]"_s, WebTimeout);
        QVERIFY(m_prompts->prompts.isEmpty());
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
        window->RunGame(file(u"opener.swf"_s, movie.bytes()));
        QTRY_COMPARE_WITH_TIMEOUT(
            m_browser->opened, QList<QUrl> {QUrl(u"http://127.0.0.1:9/more-games"_s)}, WebTimeout);
        QVERIFY(!shownWindowTitled(u"Online games"_s));
        window->close();
        QTRY_VERIFY(window.isNull());
    }

    void animatedPictureAdvertisementPlays()
    {
        // A looping GIF of two 1 x 1 frames, red then blue, 0.1 s each.
        const QByteArray gif = "GIF89a" + QByteArray::fromHex("01000100800100ff00000000ff21ff0b") + "NETSCAPE2.0"
            + QByteArray::fromHex(
                "0301000000"
                "21f904000a0000002c000000000100010000020244010021f904000a0000002c00000000010001000002024c01003b");
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(file(u"Image_blink.gif"_s, gif), QString());
        QCOMPARE(window->DisplayModeValue(), 1);
        const auto centre = [&] { return window->grab().toImage().pixelColor(319, 239); };
        QTRY_COMPARE_WITH_TIMEOUT(centre(), QColor(Qt::blue), 5000);
        QTRY_COMPARE_WITH_TIMEOUT(centre(), QColor(Qt::red), 5000);
        QTest::keyClick(window, Qt::Key_Escape);
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_browser->opened.isEmpty());
    }

    void missingRuffleGivesItsMessage()
    {
        qputenv("BRIMVAULT_PROGRAM_DIR", m_env.path(u"program-without-ruffle"_s).toLocal8Bit());
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(file(u"any.swf"_s, SwfBuilder(8, 10, 10, 1).bytes()));
        qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR);
        QCOMPARE(m_prompts->texts(), QStringList {u"Macromedia Shockwave Flash Control not installed properly."_s});
        QCOMPARE(m_prompts->prompts.constFirst().icon, PromptIcon::Critical);
        QTRY_VERIFY(window.isNull());
    }

    void missingWebEngineGivesItsMessage()
    {
        qputenv("QTWEBENGINE_PROCESS_PATH", m_env.path(u"no-such-process"_s).toLocal8Bit());
        QPointer<frmReclama> window = new frmReclama();
        const bool loaded = window->LoadHTML(u"http://127.0.0.1:9/page.html"_s);
        QWebEngineView* browser = window->GetIE();
        const QString fallback = page(u"fallback.html"_s, "x");
        QPointer<frmReclama> launcher = new frmReclama();
        launcher->RunGame(fallback);
        qunsetenv("QTWEBENGINE_PROCESS_PATH");

        QVERIFY(!loaded && !browser);
        QCOMPARE(window->DisplayModeValue(), 0);
        QCOMPARE(m_prompts->texts(), QStringList {u"Internet Explorer Control not installed properly."_s});
        QCOMPARE(m_prompts->prompts.constFirst().icon, PromptIcon::Critical);
        // The launcher hands a page it cannot show to the default browser.
        QCOMPARE(m_browser->opened, QList<QUrl> {QUrl::fromLocalFile(fallback)});
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
