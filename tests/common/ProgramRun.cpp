#include "ProgramRun.h"

#include <QProcess>

using namespace Qt::StringLiterals;

int RunService(const QStringList& arguments, QString* output)
{
    QProcess service;
    QProcessEnvironment variables = QProcessEnvironment::systemEnvironment();
    variables.insert(u"QT_QPA_PLATFORM"_s, u"offscreen"_s);
    service.setProcessEnvironment(variables);
    service.setProcessChannelMode(QProcess::MergedChannels);
    service.start(ServicePath(), arguments);
    const bool ended = service.waitForFinished(60000) && service.exitStatus() == QProcess::NormalExit;
    if (!ended)
        service.kill(), service.waitForFinished(10000);
    if (output)
        *output = QString::fromLocal8Bit(service.readAll());
    return ended ? service.exitCode() : -1;
}
