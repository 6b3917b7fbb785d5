// Main-icon extraction to .ico over real PE files, beside wrestool over the same files and beside just reading
// their bytes. Prints figure and ratio lines (ratios are our time over the reference's: below 1 is ahead).
#include "RealPeFiles.h"
#include "icons/cFileIcon.h"

#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QProcess>
#include <QStandardPaths>
#include <QTemporaryDir>
#include <QTextStream>
#include <algorithm>
#include <functional>
#include <limits>

using namespace Brimvault;

namespace {

// Median seconds per pass over the files, each sample repeating passes for at least a quarter second.
double secondsPerPass(const std::function<void()>& pass)
{
    QList<double> samples;
    for (int sample = 0; sample < 5; ++sample) {
        QElapsedTimer timer;
        timer.start();
        int passes = 0;
        do {
            pass();
            ++passes;
        } while (timer.nsecsElapsed() < 250'000'000);
        samples.append(double(timer.nsecsElapsed()) / 1e9 / passes);
    }
    std::sort(samples.begin(), samples.end());
    return samples.at(samples.size() / 2);
}

} // namespace

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    QTextStream out(stdout);
    const QStringList files
        = RealPeFiles({QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe")}, std::numeric_limits<int>::max());
    QTemporaryDir scratch;
    if (files.isEmpty() || !scratch.isValid()) {
        out << "no PE files found\n";
        return 1;
    }
    qint64 bytes = 0;
    int withIcon = 0;
    for (const QString& file : files) {
        bytes += QFileInfo(file).size();
        cFileIcon icon;
        withIcon += icon.LoadMainIconFromEXE(file) ? 1 : 0;
    }
    out << "files " << files.size() << " (" << withIcon << " with an icon, " << bytes / 1024 << " KiB)\n";

    const double read = secondsPerPass([&] {
        for (const QString& file : files) {
            QFile f(file);
            if (f.open(QIODevice::ReadOnly))
                (void)f.readAll();
        }
    });
    // Every pass writes new files into a folder of its own, as the icon cache writes one new file per game:
    // overwriting the same file again and again would measure the file system's flush-on-truncate instead.
    int pass = 0;
    const auto passFolder = [&](const QString& prefix) {
        const QString folder = scratch.filePath(prefix + QString::number(++pass));
        QDir().mkpath(folder);
        return folder + u'/';
    };
    const double ours = secondsPerPass([&] {
        const QString folder = passFolder(QStringLiteral("ours-"));
        for (qsizetype i = 0; i < files.size(); ++i) {
            cFileIcon icon;
            if (icon.LoadMainIconFromEXE(files.at(i)))
                icon.SaveIcon(folder + QString::number(i) + QStringLiteral(".ico"));
        }
    });

    const double n = files.size();
    out << "figure icons_extract " << n / ours << " files/s\n";
    out << "figure icons_read_bytes " << n / read << " files/s\n";
    out << "ratio icons_extract_vs_read " << ours / read << '\n';

    const QString wrestool = QStandardPaths::findExecutable(QStringLiteral("wrestool"));
    if (wrestool.isEmpty()) {
        out << "wrestool not installed: no reference\n";
        return 0;
    }
    // One wrestool process per file, as a tool that extracts one game's icon at a time would run it.
    const double reference = secondsPerPass([&] {
        const QString wrestoolOut = passFolder(QStringLiteral("wrestool-"));
        for (const QString& file : files) {
            QProcess process;
            process.setStandardOutputFile(QProcess::nullDevice());
            process.setStandardErrorFile(QProcess::nullDevice());
            process.start(wrestool,
                {QStringLiteral("-x"), QStringLiteral("-t"), QStringLiteral("14"), QStringLiteral("-o"), wrestoolOut,
                    file});
            process.waitForFinished(-1);
        }
    });
    // And all files in one wrestool process, its best case.
    const double referenceBatch = secondsPerPass([&] {
        const QString wrestoolOut = passFolder(QStringLiteral("wrestool-batch-"));
        QProcess process;
        process.setStandardOutputFile(QProcess::nullDevice());
        process.setStandardErrorFile(QProcess::nullDevice());
        process.start(wrestool,
            QStringList {
                QStringLiteral("-x"), QStringLiteral("-t"), QStringLiteral("14"), QStringLiteral("-o"), wrestoolOut}
                + files);
        process.waitForFinished(-1);
    });
    out << "figure wrestool_extract " << n / reference << " files/s\n";
    out << "figure wrestool_extract_one_process " << n / referenceBatch << " files/s\n";
    out << "ratio icons_extract_vs_wrestool " << ours / reference << '\n';
    out << "ratio icons_extract_vs_wrestool_one_process " << ours / referenceBatch << '\n';
    return 0;
}
