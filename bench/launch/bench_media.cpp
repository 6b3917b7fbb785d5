// From asking the media host to play a Flash movie to Ruffle reporting the movie's metadata, against the
// floor of that path: the same host window loading a plain local page.
#include "BenchReport.h"
#include "MovieFiles.h"
#include "TestFiles.h"

#include "media/WebEngineStartup.h"
#include "media/frmReclama.h"

#include <QApplication>
#include <QDeadlineTimer>
#include <QDir>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QFile>
#include <QPointer>
#include <QTemporaryDir>
#include <QTextStream>
#include <QWebEnginePage>
#include <QWebEngineView>
#include <algorithm>
#include <cstdio>

using namespace Brimvault;
using namespace Brimvault::BenchReport;

namespace {

constexpr int Runs = 7;
constexpr int TimeoutMs = 60000;

template <typename Condition>
bool waitFor(Condition condition, int timeoutMs)
{
    QDeadlineTimer deadline(timeoutMs);
    while (!condition()) {
        if (deadline.hasExpired())
            return false;
        QCoreApplication::processEvents(QEventLoop::AllEvents, 5);
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    }
    return true;
}

void pause(int ms)
{
    waitFor([] { return false; }, ms);
}

bool evaluatesTrue(QWebEngineView* view, const QString& script)
{
    bool done = false;
    bool value = false;
    view->page()->runJavaScript(script, [&](const QVariant& result) {
        value = result.toBool();
        done = true;
    });
    waitFor([&] { return done; }, TimeoutMs);
    return value;
}

// Milliseconds until `ready` holds for the window's view, or -1.
template <typename Start, typename View>
double measure(Start start, View view, const QString& ready)
{
    QPointer<frmReclama> window = new frmReclama();
    QElapsedTimer timer;
    timer.start();
    start(window.data());
    bool reached = false;
    while (!reached && timer.elapsed() < TimeoutMs) {
        QWebEngineView* shown = window ? view(window.data()) : nullptr;
        reached = shown && evaluatesTrue(shown, ready);
        if (!reached)
            pause(5);
    }
    const double elapsed = reached ? double(timer.nsecsElapsed()) / 1e6 : -1.0;
    if (window)
        window->close();
    pause(50);
    return elapsed;
}

} // namespace

int main(int argc, char* argv[])
{
    QTemporaryDir root;
    for (const char* variable : {"BRIMVAULT_SETTINGS_DIR", "BRIMVAULT_COMMON_APPDATA", "BRIMVAULT_PERSONAL"})
        qputenv(variable, root.path().toLocal8Bit());
    qputenv("BRIMVAULT_CATALOGUE_ROOT", "http://127.0.0.1:9");
    if (qEnvironmentVariableIsEmpty("BRIMVAULT_PROGRAM_DIR"))
        qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR);
    PrepareWebEngine();
    QApplication app(argc, argv);

    const QString movie = QDir(root.path()).filePath(QStringLiteral("movie.swf"));
    const QString page = QDir(root.path()).filePath(QStringLiteral("page.html"));
    SwfBuilder oneFrame;
    oneFrame.addTag(9, QByteArrayLiteral("\x20\x40\x60")); // a background colour and nothing else
    oneFrame.showFrame();
    QFile pageFile(page);
    if (!WriteFile(movie, oneFrame.bytes()) || !pageFile.open(QIODevice::WriteOnly))
        return 1;
    pageFile.write("<!DOCTYPE html><html><body><p id=\"ready\">ready</p></body></html>");
    pageFile.close();

    const auto playMovie = [&](frmReclama* window) { window->RunGame(movie); };
    const auto flashView = [](frmReclama* window) { return window->oFlash(); };
    const QString metadataReady = QStringLiteral("!!(window.brimvault && window.brimvault.metadata)");
    const auto showPage = [&](frmReclama* window) { window->RunGame(page); };
    const auto pageView = [](frmReclama* window) { return window->oIE(); };
    const QString pageReady = QStringLiteral("!!document.getElementById('ready')");

    // The first movie also starts the web engine and compiles Ruffle.
    const double cold = measure(playMovie, flashView, metadataReady);
    std::vector<double> movieTimes;
    std::vector<double> pageTimes;
    for (int run = 0; run < Runs; ++run) {
        movieTimes.push_back(measure(playMovie, flashView, metadataReady));
        pageTimes.push_back(measure(showPage, pageView, pageReady));
    }
    if (cold < 0 || std::any_of(movieTimes.cbegin(), movieTimes.cend(), [](double t) { return t < 0; })) {
        std::fprintf(stderr, "Ruffle did not report the movie's metadata (is Ruffle installed beside the program?)\n");
        return 1;
    }
    figure("media_movie_metadata_first", cold, "ms");
    figure("media_movie_metadata_median", median(movieTimes), "ms");
    figure("media_plain_page_median", median(pageTimes), "ms");
    ratio("media_movie_vs_plain_page", median(movieTimes), median(pageTimes));
    return 0;
}
