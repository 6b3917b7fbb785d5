// The main window over generated libraries of 1,000 and 10,000 installed games (each in its own folder with
// a real executable, an info file and a cached icon): from construction to the list filled with every icon
// shown (the median of three windows), and the process's resident memory with the larger library on screen.
// Set BRIMVAULT_BENCH_LIBRARIES to a folder to make the libraries once and measure them again in later runs.
#include "BenchLibrary.h"
#include "BenchReport.h"
#include "WindowFill.h"
#include "catalogue/IconCacheKey.h"
#include "icons/cFileIcon.h"
#include "store/DataFolders.h"
#include "store/clsFileBag.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QFile>
#include <QTemporaryDir>
#include <QTextStream>
#include <QTimer>

#include <algorithm>
#include <memory>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchLibrary;
using namespace Brimvault::BenchReport;

namespace {

// As in the catalogue benchmark: a thousand games added by hand beside the installed ones.
constexpr int AddedByHand = 1000;
constexpr int FillRuns = 3;

// Milliseconds from construction until discovery has filled the list and no icon waits; -1 when it did not
// get there within a minute.
double fillWindow(int installed, double* rssMegabytes)
{
    bool rebuilt = false;
    double elapsed = 0;
    std::unique_ptr<frmMain> window = OpenFilledWindow(60000, &rebuilt, &elapsed);
    // The list also holds the entry for more games on line; count only the generated ones.
    int items = 0;
    for (int i = 0; i < window->ListView1()->layoutState().itemCount; ++i)
        items += window->ListView1()->labN(i).text().startsWith(QStringLiteral("Game game"));
    if (!rebuilt || window->pendingIcons() != 0 || items != installed) {
        QTextStream(stderr) << "window listed " << items << " of " << installed << " games, " << window->pendingIcons()
                            << " icons pending\n";
        return -1;
    }
    if (rssMegabytes)
        *rssMegabytes = residentMegabytes();
    window.reset();
    QCoreApplication::processEvents();
    return elapsed;
}

} // namespace

int main(int argc, char** argv)
{
    QApplication app(argc, argv);
    const std::optional<GameFiles> files = loadGameFiles(QStringLiteral(BENCH_PE_FIXTURE));
    if (!files)
        return 1;
    const QByteArray& exe = files->exe;
    const QByteArray& iconBytes = files->icon;
    const QList<int> sizes = librarySizes(app.arguments().mid(1));
    int failures = 0;
    for (int installed : std::as_const(sizes)) {
        QTemporaryDir temporary;
        const QString root = reusableLibrary(installed, AddedByHand, exe, iconBytes);
        if (root.isEmpty() && !makeLibrary(temporary.path(), installed, AddedByHand, exe, iconBytes)) {
            QTextStream(stderr) << "could not build the library of " << installed << " games\n";
            return 1;
        }
        // The machines are shared: the median of a few fills, and the largest resident size seen.
        std::vector<double> fills;
        double rss = -1;
        for (int run = 0; run < FillRuns; ++run) {
            double runRss = -1;
            const double fill = fillWindow(installed, &runRss);
            if (fill < 0)
                break;
            fills.push_back(fill);
            rss = qMax(rss, runRss);
        }
        if (fills.size() != std::size_t(FillRuns)) {
            ++failures;
            continue;
        }
        figure(QStringLiteral("window_fill_%1").arg(installed), median(fills), "ms");
        if (installed == 10000)
            figure(QStringLiteral("window_rss_10000"), rss, "MB");
    }
    return failures == 0 ? 0 : 1;
}
