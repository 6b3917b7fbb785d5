// Installing a package of 1,000 files and 200 MB with the real service process, beside unzip extracting
// the same archive in the same run. Both read a warm archive and write to the same file system.
#include "BenchReport.h"
#include "PackageWriter.h"

#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QProcess>
#include <QRandomGenerator>
#include <QStandardPaths>
#include <QTemporaryDir>
#include <QTextStream>

#include <algorithm>
#include <functional>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchReport;

namespace {

constexpr int Files = 1000;
constexpr qint64 TotalBytes = qint64(200) * 1024 * 1024;
constexpr int Runs = 5;

// Game data as it comes: about half already compressed (random), half repetitive tables and text.
QByteArray fileContents(qint64 size, quint32 seed)
{
    QByteArray bytes(size, Qt::Uninitialized);
    QRandomGenerator generator(seed);
    const QByteArray pattern = QByteArrayLiteral("level=%d;sprite=hero_walk_%02d.png;score=000000;\n");
    for (qint64 at = 0; at < size; at += 4096) {
        const qint64 chunk = std::min<qint64>(4096, size - at);
        if (generator.bounded(2) == 0) {
            for (qint64 i = 0; i < chunk; ++i)
                bytes[at + i] = char(generator.generate());
        } else {
            for (qint64 i = 0; i < chunk; ++i)
                bytes[at + i] = pattern.at((at + i) % pattern.size());
        }
    }
    return bytes;
}

bool makeGame(const QString& folder)
{
    QDir().mkpath(folder);
    QRandomGenerator sizes(42);
    const qint64 average = TotalBytes / Files;
    qint64 written = 0;
    for (int i = 0; i < Files; ++i) {
        const QString sub = QStringLiteral("%1/data%2").arg(folder).arg(i % 20);
        QDir().mkpath(sub);
        const qint64 size = i == Files - 1 ? TotalBytes - written : average / 4 + sizes.bounded(average * 3 / 2);
        const QString name = i == 0 ? folder + QStringLiteral("/Bench.exe") : sub + QStringLiteral("/f%1.dat").arg(i);
        QFile file(name);
        if (!file.open(QIODevice::WriteOnly) || file.write(fileContents(std::max<qint64>(size, 0), quint32(i))) < 0)
            return false;
        written += std::max<qint64>(size, 0);
    }
    return true;
}

double timedRun(const QString& program, const QStringList& arguments, bool& ok)
{
    QProcess process;
    process.setStandardOutputFile(QProcess::nullDevice());
    process.setStandardErrorFile(QProcess::nullDevice());
    QElapsedTimer timer;
    timer.start();
    process.start(program, arguments);
    ok = process.waitForFinished(600000) && process.exitStatus() == QProcess::NormalExit && process.exitCode() == 0;
    return double(timer.nsecsElapsed()) / 1e6;
}

} // namespace

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    const QString unzip = QStandardPaths::findExecutable(QStringLiteral("unzip"));
    QTemporaryDir root;
    if (!root.isValid())
        return 1;
    qputenv("BRIMVAULT_SETTINGS_DIR", QFile::encodeName(root.filePath(QStringLiteral("settings"))));
    qputenv("BRIMVAULT_COMMON_APPDATA", QFile::encodeName(root.filePath(QStringLiteral("appdata"))));
    qputenv("QT_QPA_PLATFORM", "offscreen");
    const QString games = root.filePath(QStringLiteral("appdata/Brimvault"));
    const QString package = root.filePath(QStringLiteral("bench.bvxpak"));

    if (!makeGame(root.filePath(QStringLiteral("source/Bench")))) {
        QTextStream(stderr) << "cannot write the game data" << Qt::endl;
        return 1;
    }
    QElapsedTimer packTimer;
    packTimer.start();
    if (const QString problem = PackGameFolder(root.filePath(QStringLiteral("source/Bench")), package);
        !problem.isEmpty()) {
        QTextStream(stderr) << problem << Qt::endl;
        return 1;
    }
    figure("service_pack_200mb", double(packTimer.elapsed()), "ms");
    QDir(root.filePath(QStringLiteral("source"))).removeRecursively();
    figure("service_package_size", double(QFileInfo(package).size()) / 1048576.0, "MB");

    const QString service = QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService");
    const QString unzipTarget = root.filePath(QStringLiteral("unzipped"));
    std::vector<double> ours;
    std::vector<double> reference;
    for (int run = 0; run < Runs; ++run) {
        bool ok = false;
        ours.push_back(timedRun(service, {QStringLiteral("-I"), package}, ok));
        if (!ok || !QFileInfo::exists(games + QStringLiteral("/Bench/Bench.exe"))) {
            QTextStream(stderr) << "install failed" << Qt::endl;
            return 1;
        }
        QDir(games).removeRecursively();
        if (!unzip.isEmpty()) {
            reference.push_back(timedRun(
                unzip, {QStringLiteral("-q"), QStringLiteral("-o"), package, QStringLiteral("-d"), unzipTarget}, ok));
            QDir(unzipTarget).removeRecursively();
            if (!ok)
                reference.pop_back();
        }
    }
    figure("service_install_1000_files_200mb", median(ours), "ms");
    if (reference.empty()) {
        QTextStream(stderr) << "unzip not found: no reference" << Qt::endl;
        return 0;
    }
    figure("unzip_1000_files_200mb", median(reference), "ms");
    ratio("service_install_vs_unzip", median(ours), median(reference));
    return 0;
}
