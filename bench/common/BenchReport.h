#pragma once

#include <QString>

#include <functional>
#include <vector>

// The lines every benchmark prints for tools/run-bench.sh: `figure <name> <value> <unit>` and
// `ratio <name> <ours/reference>` (below 1 means we are ahead of the reference).
namespace Brimvault::BenchReport {

void figure(const QString& name, double value, const char* unit);
void ratio(const QString& name, double ours, double reference);
void figure(const char* name, double value, const char* unit);
void ratio(const char* name, double ours, double reference);

// The middle value; -1 for no values, so that a figure which measured nothing stands out.
double median(std::vector<double> values);
double medianMilliseconds(int runs, const std::function<void()>& work);

// This process's resident memory in megabytes; -1 where it cannot be read.
double residentMegabytes();

} // namespace Brimvault::BenchReport
