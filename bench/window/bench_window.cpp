// The main window over generated libraries of 1,000, 10,000 and 30,000 installed games (each in its own folder
// with a real executable, an info file and a cached icon) and 1,000 added by hand: from construction to the
// list filled with every icon shown and to the first screen painted (the median of three windows), beside
// the least reading any program must do for that library; the longest the event loop waited during a fill;
// the process's resident memory with the library on screen.
// Set BRIMVAULT_BENCH_LIBRARIES to a folder to make the libraries once and measure them again in later runs.
#include "BenchLibrary.h"
#include "BenchReport.h"
#include "ReadFloor.h"
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

// One window from construction until discovery has filled the list and no icon waits; nothing when it did not
// get there within a minute.
std::optional<FillTimes> fillWindow(int installed, double* rssMegabytes)
{
    FillTimes times;
    std::unique_ptr<frmMain> window = OpenFilledWindow(60000, &times);
    // The list also holds the entry for more games on line; count only the generated ones.
    int items = 0;
    for (int i = 0; i < window->ListView1()->layoutState().itemCount; ++i)
        items += window->ListView1()->labN(i).text().startsWith(QStringLiteral("Game game"));
    if (!times.filled || items != installed) {
        QTextStream(stderr) << "window listed " << items << " of " << installed << " games, " << window->pendingIcons()
                            << " icons pending\n";
        return std::nullopt;
    }
    *rssMegabytes = residentMegabytes();
    window.reset();
    QCoreApplication::processEvents();
    return times;
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
        std::vector<double> fills, firstScreens, gaps;
        double rss = -1;
        for (int run = 0; run < FillRuns; ++run) {
            double runRss = -1;
            const std::optional<FillTimes> times = fillWindow(installed, &runRss);
            if (!times)
                break;
            fills.push_back(times->fill);
            firstScreens.push_back(times->firstScreen);
            gaps.push_back(times->longestGap);
            rss = qMax(rss, runRss);
        }
        const double floor
            = ReadFloor::milliseconds((root.isEmpty() ? temporary.path() : root) + QStringLiteral("/added"), FillRuns);
        if (fills.size() != std::size_t(FillRuns) || floor < 0) {
            ++failures;
            continue;
        }
        const QString suffix = QString::number(installed);
        const double fill = median(fills);
        figure(QStringLiteral("window_fill_") + suffix, fill, "ms");
        figure(QStringLiteral("read_floor_") + suffix, floor, "ms");
        ratio(QStringLiteral("window_fill_vs_floor_") + suffix, fill, floor);
        figure(QStringLiteral("window_first_screen_") + suffix, median(firstScreens), "ms");
        ratio(QStringLiteral("window_first_screen_vs_fill_") + suffix, median(firstScreens), fill);
        figure(QStringLiteral("window_longest_event_gap_") + suffix, *std::max_element(gaps.begin(), gaps.end()), "ms");
        figure(QStringLiteral("window_rss_") + suffix, rss, "MB");
    }
    return failures == 0 ? 0 : 1;
}
