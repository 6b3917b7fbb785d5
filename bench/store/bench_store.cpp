// Settings reads, record bag lookups and the added-games enumeration on a catalogue of realistic size.
// The reference for a settings read is QSettings over the same INI file, opened per read as the program
// reads (every read must see what the service wrote meanwhile).
#include "BenchReport.h"
#include "store/CatalogueStore.h"
#include "store/SettingsStore.h"
#include "store/clsFileBag.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QSettings>
#include <QTemporaryDir>
#include <QTextStream>

#include <algorithm>
#include <functional>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchReport;

namespace {

// Median over runs of the time per call, in microseconds.
double microsecondsPerCall(int calls, const std::function<void()>& call)
{
    std::vector<double> runs;
    for (int run = 0; run < 7; ++run) {
        QElapsedTimer timer;
        timer.start();
        for (int i = 0; i < calls; ++i)
            call();
        runs.push_back(double(timer.nsecsElapsed()) / 1000.0 / calls);
    }
    std::sort(runs.begin(), runs.end());
    return runs[runs.size() / 2];
}

} // namespace

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    QTemporaryDir root;
    qputenv("BRIMVAULT_SETTINGS_DIR", root.path().toLocal8Bit());

    constexpr int games = 500;
    for (int i = 0; i < games; ++i)
        CatalogueStore::AddGame(QStringLiteral("/home/user/Games/Game %1/game%1.exe").arg(i));
    SaveSetting(AppTitle(), QStringLiteral("Commands"), QStringLiteral("NewGameInstalled"), QStringLiteral("0"));

    const QString commands = QStringLiteral("Commands");
    const QString key = QStringLiteral("NewGameInstalled");
    const double ours = microsecondsPerCall(2000, [&] { GetSetting(AppTitle(), commands, key); });
    const double reference = microsecondsPerCall(2000, [&] {
        QSettings settings(SettingsFilePath(AppTitle()), QSettings::IniFormat);
        settings.value(commands + u'/' + key);
    });
    figure("settings_get", ours, "us");
    figure("settings_get_qsettings", reference, "us");
    ratio("settings_get", ours, reference);

    int n = 0;
    figure("settings_save",
        microsecondsPerCall(50, [&] { SaveSetting(AppTitle(), commands, key, QString::number(++n % 2)); }), "us");
    figure("added_games_500", microsecondsPerCall(50, [] { CatalogueStore::AddedGames(); }), "us");
    const QString lookedUp = QStringLiteral("/HOME/user/games/game 499/GAME499.EXE");
    figure("find_added_game_500", microsecondsPerCall(50, [&] { CatalogueStore::FindAddedGame(lookedUp); }), "us");
    const auto index = CatalogueStore::IndexByPath(CatalogueStore::AddedGames());
    figure("indexed_lookup_500",
        microsecondsPerCall(20000, [&] { index.contains(CatalogueStore::NormalisedPath(lookedUp)); }), "us");

    clsFileBag bag;
    for (int i = 0; i < 50; ++i)
        bag.SetRecord(clsFileBag::MakeKey(QStringLiteral("Name_%1").arg(i)), QStringLiteral("Display name %1").arg(i));
    const QString last = clsFileBag::MakeKey(QStringLiteral("name_49"));
    figure("recordbag_getvalue_50_lines", microsecondsPerCall(20000, [&] { bag.GetValue(last); }), "us");
    return 0;
}
