#pragma once

#include <QString>
#include <QStringList>

namespace Brimvault {

// The service's command line: what the program starts it with, plus --pack for publishers.
struct ServiceCommand {
    enum class Kind { Install, Tidy, AfterLaunch, Pack, Usage };

    Kind kind = Kind::Usage;
    QString package; // Install, Pack
    QString gameFolder; // Pack
};

// Arguments without the program name. Switches ignore letter case and may start with "-" or "/".
ServiceCommand ParseServiceCommandLine(const QStringList& arguments);

QString ServiceUsage();

} // namespace Brimvault
