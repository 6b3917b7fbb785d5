// Discovery on generated libraries of 1,000, 10,000 and 30,000 installed games (each in its own folder with a real
// executable, an info file and a cached icon) plus 1,000 games added by hand. The folder walk is measured
// beside `find` over the same tree; the listing command from process start to exit, beside
// the least reading any program must do for that library.
#include "BenchLibrary.h"
#include "BenchReport.h"
#include "ReadFloor.h"
#include "catalogue/CatalogueListing.h"
#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/IconCacheKey.h"
#include "catalogue/ListBuilder.h"
#include "icons/cFileIcon.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"
#include "store/clsFileBag.h"

#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QGuiApplication>
#include <QProcess>
#include <QTemporaryDir>
#include <QTextStream>

#include <algorithm>
#include <functional>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchLibrary;
using namespace Brimvault::BenchReport;

namespace {

constexpr int AddedByHand = 1000;

qsizetype runFind(const QString& folder)
{
    QProcess find;
    find.start(QStringLiteral("find"), {folder, QStringLiteral("-iname"), QStringLiteral("*.exe")});
    find.waitForFinished(-1);
    return find.readAllStandardOutput().count('\n');
}

qsizetype runListCommand()
{
    QProcess list;
    list.start(QStringLiteral(BENCH_PROGRAM), {QStringLiteral("--list")});
    list.waitForFinished(-1);
    return list.exitCode() == 0 ? list.readAllStandardOutput().count('\n') : -1;
}

void measure(int installed, const QByteArray& exe, const QByteArray& icon)
{
    QTemporaryDir temporary;
    QString root = reusableLibrary(installed, AddedByHand, exe, icon);
    if (root.isEmpty() && makeLibrary(temporary.path(), installed, AddedByHand, exe, icon))
        root = temporary.path();
    if (root.isEmpty()) {
        QTextStream(stderr) << "could not build the library of " << installed << " games\n";
        return;
    }
    const QString suffix = QString::number(installed);
    const CatalogueLocations locations = CatalogueLocations::fromSystem();
    ListBuilder builder(locations.iconsFolder);
    GameDiscovery discovery(builder, locations);

    qsizetype walked = 0;
    qsizetype found = 0;
    runFind(locations.gamesFolder); // warm the cache for both
    const double walk = medianMilliseconds(7, [&] {
        QStringList files;
        discovery.ForEachInstalledGameFile(
            [&files](const QString& file) {
                files.append(file);
                return true;
            },
            {});
        walked = files.size();
    });
    const double reference = medianMilliseconds(7, [&] { found = runFind(locations.gamesFolder); });
    if (walked != installed || found != installed)
        QTextStream(stderr) << "walk found " << walked << ", find " << found << ", expected " << installed << '\n';
    figure(QStringLiteral("folder_walk_") + suffix, walk, "ms");
    figure(QStringLiteral("folder_walk_find_") + suffix, reference, "ms");
    ratio(QStringLiteral("folder_walk_") + suffix, walk, reference);

    int items = 0;
    builder.setKeepPictures(true);
    const double discover = medianMilliseconds(3, [&] {
        items = 0;
        DiscoveryHooks hooks;
        hooks.addItem = [&items](const GameEntry&) { ++items; };
        discovery.Run(hooks);
    });
    figure(QStringLiteral("discovery_with_pictures_") + suffix, discover, "ms");

    qsizetype lines = 0;
    const double listing = medianMilliseconds(5, [&] { lines = runListCommand(); });
    if (lines != items)
        QTextStream(stderr) << "--list printed " << lines << " lines, discovery gave " << items << '\n';
    figure(QStringLiteral("list_command_") + suffix, listing, "ms");
    const double floor = ReadFloor::milliseconds(root + QStringLiteral("/added"), 5);
    figure(QStringLiteral("read_floor_") + suffix, floor, "ms");
    ratio(QStringLiteral("list_command_vs_floor_") + suffix, listing, floor);
}

} // namespace

int main(int argc, char** argv)
{
    QGuiApplication app(argc, argv);
    const std::optional<GameFiles> files = loadGameFiles(QStringLiteral(BENCH_PE_FIXTURE));
    if (!files)
        return 1;
    const QByteArray& exe = files->exe;
    const QByteArray& iconBytes = files->icon;
    const QList<int> sizes = librarySizes(app.arguments().mid(1));
    for (int installed : std::as_const(sizes))
        measure(installed, exe, iconBytes);
    return 0;
}
