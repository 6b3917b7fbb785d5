// From a launch call on a list item to the game's process running (it has written its record), against
// starting the same program directly with QProcess::startDetached in the same folder.
#include "BenchReport.h"
#include "gameactions/GameLauncher.h"

#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QTemporaryDir>
#include <QTextStream>
#include <QThread>

#include <algorithm>
#include <functional>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchReport;

namespace {

constexpr int Runs = 21;
constexpr qint64 GiveUpNs = 5'000'000'000;

struct Timing {
    double callMs = 0; // until the launch call returns: the process exists
    double runningMs = 0; // until the program has run far enough to write its record
};

Timing measure(const QString& record, const std::function<void()>& launch)
{
    QFile::remove(record);
    QElapsedTimer clock;
    clock.start();
    launch();
    Timing timing;
    timing.callMs = double(clock.nsecsElapsed()) / 1e6;
    while (!QFileInfo::exists(record) && clock.nsecsElapsed() < GiveUpNs)
        QThread::usleep(50);
    timing.runningMs = double(clock.nsecsElapsed()) / 1e6;
    return timing;
}

} // namespace

int main(int argc, char** argv)
{
    QTemporaryDir root;
    if (!root.isValid())
        return 1;
    const QString base = root.path();
    for (const char* sub : {"settings", "commonappdata", "personal", "program", "records"})
        QDir(base).mkpath(QString::fromLatin1(sub));
    qputenv("BRIMVAULT_SETTINGS_DIR", (base + QStringLiteral("/settings")).toLocal8Bit());
    qputenv("BRIMVAULT_COMMON_APPDATA", (base + QStringLiteral("/commonappdata")).toLocal8Bit());
    qputenv("BRIMVAULT_PERSONAL", (base + QStringLiteral("/personal")).toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_DIR", (base + QStringLiteral("/program")).toLocal8Bit());
    qputenv("BV_LAUNCH_RECORD", (base + QStringLiteral("/records")).toLocal8Bit());
    QCoreApplication app(argc, argv);

    const QString folder = base + QStringLiteral("/commonappdata/Brimvault/Star Lines");
    const QString game = folder + QStringLiteral("/star lines");
    QDir().mkpath(folder);
    if (!QFile::copy(QStringLiteral(LAUNCH_RECORDER), game))
        return 1;
    const QString record = base + QStringLiteral("/records/star lines.record");

    GameLauncher launcher;
    // The first launch of a run also starts the service; measure the launches after it.
    const Timing first = measure(record, [&] { launcher.launchItem(game, QString()); });

    std::vector<double> ourCall, ourRunning, referenceCall, referenceRunning;
    for (int run = 0; run < Runs; ++run) {
        const Timing ours = measure(record, [&] { launcher.launchItem(game, QString()); });
        ourCall.push_back(ours.callMs);
        ourRunning.push_back(ours.runningMs);
        const Timing reference = measure(record, [&] { QProcess::startDetached(game, {}, folder); });
        referenceCall.push_back(reference.callMs);
        referenceRunning.push_back(reference.runningMs);
    }

    figure("launch_first_to_running", first.runningMs, "ms");
    figure("launch_call", median(ourCall), "ms");
    figure("launch_to_running", median(ourRunning), "ms");
    figure("startdetached_to_running", median(referenceRunning), "ms");
    ratio("launch_call", median(ourCall), median(referenceCall));
    ratio("launch_to_running", median(ourRunning), median(referenceRunning));
    return 0;
}
