// The media host window with the real web engine: pages, still pictures and Flash movies played by Ruffle.
#include "AdvertisingFiles.h"
#include "MovieFiles.h"
#include "PromptRecorder.h"
#include "RuffleFixture.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "UrlCatcher.h"

#include "media/BrowserEmulation.h"
#include "media/MediaHostFiles.h"
#include "media/frmReclama.h"

#include <QPointer>
#include <QToolButton>
#include <QWebEngineView>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

constexpr int WebTimeout = 30000;

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
    for (QWidget* window : QApplication::topLevelWidgets())
        if (auto* host = qobject_cast<frmReclama*>(window); host && host->isVisible() && host->windowTitle() == title)
            return host;
    return nullptr;
}

} // namespace

class TestMediaHost : public QObject {
    Q_OBJECT
    TestEnvironment m_env;
    std::unique_ptr<PromptRecorder> m_prompts;
    std::unique_ptr<UrlCatcher> m_browser;

    QString file(const QString& name, const QByteArray& bytes)
    {
        const QString path = m_env.path(u"pages/"_s + name);
        return WriteFile(path, bytes) ? path : QString();
    }
    QString page(const QString& name, const QByteArray& body)
    {
        return file(name, "<!DOCTYPE html><html><head><meta charset=\"utf-8\"></head><body>" + body + "</body></html>");
    }

private Q_SLOTS:
    void init()
    {
        qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR);
        m_prompts = std::make_unique<PromptRecorder>(PromptAnswer::Ok);
        m_browser = std::make_unique<UrlCatcher>();
    }
    void cleanup()
    {
        for (QWidget* window : QApplication::topLevelWidgets())
            window->close();
        m_browser.reset();
        m_prompts.reset();
    }

    void webPageNavigatesAndGoesBack()
    {
        page(u"second.html"_s, "<p>second</p>");
        QFile::remove(BrowserEmulationFile());
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(page(u"first.html"_s,
            "<a id=\"next\" href=\"second.html\" style=\"position:fixed;left:0;top:0;width:300px;height:200px;"
            "display:block\">next</a>"));
        QVERIFY(window->isMaximized() && window->DisplayModeValue() == 3);
        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(window->oIE(), u"!!document.getElementById('next')"_s), u"true"_s, WebTimeout);
        QVERIFY(!window->pbGoBack()->isVisible());
        // The first page of a window writes the browser-emulation values, later ones leave them alone.
        QVERIFY(QFile::remove(BrowserEmulationFile()));

        // The engine lets only pages the user left on purpose be returned to: a real click.
        QVERIFY(QTest::qWaitForWindowExposed(window));
        QTest::mouseClick(window->oIE()->focusProxy(), Qt::LeftButton, {}, QPoint(100, 80));
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(window), u"second.html"_s, WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(window->pbGoBack()->isVisible() && window->pbGoBack()->isEnabled(), WebTimeout);
        QVERIFY(window->oIE()->geometry().top() >= window->pbGoBack()->geometry().bottom());
        QTest::mouseClick(window->pbGoBack(), Qt::LeftButton);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(window), u"first.html"_s, WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(!window->pbGoBack()->isVisible(), WebTimeout);
        QCOMPARE(window->oIE()->geometry(), window->rect());
        QVERIFY(!QFile::exists(BrowserEmulationFile()) && m_prompts->prompts.isEmpty());
    }

    // The new window stays when the page that opened it closes itself, and its window with it.
    void newWindowOpensOnlineGamesWindow()
    {
        page(u"popup.html"_s, "popup");
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(page(u"opener.html"_s,
            "<script>window.addEventListener('load', () => { if (window.open('popup.html', '_blank', "
            "'width=500,height=400')) setTimeout(() => window.close(), 100); });</script>"));
        QPointer<frmReclama> popup;
        QTRY_VERIFY_WITH_TIMEOUT(popup = shownWindowTitled(u"Online games"_s), WebTimeout);
        QTRY_VERIFY_WITH_TIMEOUT(window.isNull(), WebTimeout);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(popup), u"popup.html"_s, WebTimeout);
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
        const QString picture = m_env.path(u"pages/Image_offer.png"_s);
        QVERIFY(WritePicture(picture, QColor(40, 90, 160), QSize(320, 200)));
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(picture, address);
        QCOMPARE(window->DisplayModeValue(), 1);
        QCOMPARE(window->size(), QSize(640, 480));
        QCOMPARE(window->cursor().shape(), Qt::PointingHandCursor);
        QVERIFY(QTest::qWaitForWindowExposed(window));
        // The space around the picture takes its colour from the picture.
        QCOMPARE(window->grab().toImage().pixelColor(2, 2), QColor(40, 90, 160));
        QTest::mouseClick(window, Qt::LeftButton, {}, QPoint(320, 240));
        QTRY_VERIFY(window.isNull());
        QTEST(m_browser->opened, "opened");
    }

    void unreadablePictureUnloadsQuietly()
    {
        QPointer<frmReclama> window = new frmReclama();
        window->ReclamaShow(file(u"Image_broken.png"_s, "not a picture at all"), u"http://ads.example/"_s);
        QTRY_VERIFY(window.isNull());
        QVERIFY(m_prompts->prompts.isEmpty() && m_browser->opened.isEmpty());
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
        const auto centre = [&] { return window->grab().toImage().pixelColor(319, 239); };
        QTRY_COMPARE_WITH_TIMEOUT(centre(), QColor(Qt::blue), 5000);
        QTRY_COMPARE_WITH_TIMEOUT(centre(), QColor(Qt::red), 5000);
        QTest::keyClick(window, Qt::Key_Escape);
        QTRY_VERIFY(window.isNull());
    }

    // A web page advertisement shows its address (an existing file, else a web address without its scheme), or
    // itself when the address is blank.
    void webPageAdvertisement()
    {
        const QString advertisement = page(u"Image_page.html"_s, "ad");
        page(u"landing.html"_s, "landing");
        QVERIFY(QDir::setCurrent(m_env.path(u"pages"_s)));
        QPointer<frmReclama> blank = new frmReclama();
        blank->ReclamaShow(advertisement, u"  "_s);
        QPointer<frmReclama> addressed = new frmReclama();
        addressed->ReclamaShow(advertisement, u"landing.html"_s);
        QCOMPARE(addressed->DisplayModeValue(), 3);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(blank), u"Image_page.html"_s, WebTimeout);
        QTRY_COMPARE_WITH_TIMEOUT(pageOf(addressed), u"landing.html"_s, WebTimeout);
        QCOMPARE(MediaHostFiles::ContentUrl(u"www.example.com/offer"_s), QUrl(u"http://www.example.com/offer"_s));
    }

    // The movie asks for its page address, hands the answer back to the page, then opens a page elsewhere.
    void flashMovieIsPlayedByRuffle()
    {
        REQUIRE_RUFFLE();
        SwfBuilder movie;
        movie.doAction(SwfBuilder::externalCall(u"window.location.href.toString"_s)
            + SwfBuilder::externalCall(u"brimvaultEcho"_s, 1) + '\x17'
            + SwfBuilder::getUrl("http://127.0.0.1:9/more-games", "_blank"));
        movie.showFrame();
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(file(u"game with blanks.swf"_s, movie.bytes()), u"Generated Game"_s);
        QCOMPARE(window->DisplayModeValue(), 2);
        QTRY_COMPARE_WITH_TIMEOUT(
            evaluate(window->oFlash(), u"JSON.stringify(window.brimvault.calls.map(c => [c.name, c.args]))"_s),
            u"[[\"window.location.href.toString\",[]],[\"brimvaultEcho\",[\"http://127.0.0.1:9\"]]]"_s, WebTimeout);
        QTRY_COMPARE_WITH_TIMEOUT(
            m_browser->opened, QList<QUrl> {QUrl(u"http://127.0.0.1:9/more-games"_s)}, WebTimeout);
        QVERIFY(m_prompts->prompts.isEmpty() && !shownWindowTitled(u"Online games"_s));
    }

    // Whatever broke in Ruffle (its WebAssembly damaged, or missing alike), the user gets the host's message, once.
    void flashThatCannotStartSaysSo_data()
    {
        QTest::addColumn<bool>("copied");
        QTest::newRow("no Ruffle") << false;
        QTest::newRow("WebAssembly damaged") << true;
    }
    void flashThatCannotStartSaysSo()
    {
        QFETCH(bool, copied);
        REQUIRE_RUFFLE();
        const QString program = m_env.path(u"program-"_s + QString::number(copied));
        QDir ruffle(program + u"/ruffle"_s);
        QVERIFY(copied ? CopyRuffleTo(program) : QDir().mkpath(program));
        for (const QString& wasm : ruffle.entryList({u"*.wasm"_s}, QDir::Files))
            QVERIFY(WriteFile(ruffle.filePath(wasm), "not WebAssembly"));
        qputenv("BRIMVAULT_PROGRAM_DIR", program.toLocal8Bit());
        QPointer<frmReclama> window = new frmReclama();
        window->RunGame(file(u"any.swf"_s, SwfBuilder().bytes()));
        QTRY_VERIFY_WITH_TIMEOUT(window.isNull(), WebTimeout);
        QCOMPARE(m_prompts->texts(), QStringList {u"Macromedia Shockwave Flash Control not installed properly."_s});
        QCOMPARE(m_prompts->prompts.constFirst().icon, PromptIcon::Critical);
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
    }
};
BV_REGISTER_TEST(TestMediaHost);
#include "tst_frmreclama.moc"
