#include "BenchReport.h"

#include <QElapsedTimer>
#include <QFile>
#include <QTextStream>

#include <algorithm>

namespace Brimvault::BenchReport {

void figure(const QString& name, double value, const char* unit)
{
    QTextStream(stdout) << "figure " << name << ' ' << value << ' ' << unit << Qt::endl;
}

void ratio(const QString& name, double ours, double reference)
{
    QTextStream(stdout) << "ratio " << name << ' ' << (reference > 0 ? ours / reference : 0.0) << Qt::endl;
}

void figure(const char* name, double value, const char* unit)
{
    figure(QString::fromLatin1(name), value, unit);
}

void ratio(const char* name, double ours, double reference)
{
    ratio(QString::fromLatin1(name), ours, reference);
}

double median(std::vector<double> values)
{
    if (values.empty())
        return -1;
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

double medianMilliseconds(int runs, const std::function<void()>& work)
{
    std::vector<double> times;
    for (int run = 0; run < runs; ++run) {
        QElapsedTimer timer;
        timer.start();
        work();
        times.push_back(double(timer.nsecsElapsed()) / 1e6);
    }
    return median(times);
}

double residentMegabytes()
{
    QFile status(QStringLiteral("/proc/self/status"));
    if (!status.open(QIODevice::ReadOnly))
        return -1;
    for (const QByteArray& line : status.readAll().split('\n')) {
        if (line.startsWith("VmRSS:"))
            return line.mid(6).trimmed().split(' ').value(0).toDouble() / 1024.0;
    }
    return -1;
}

} // namespace Brimvault::BenchReport
