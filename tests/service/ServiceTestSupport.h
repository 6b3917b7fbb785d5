#pragma once

#include <QByteArray>
#include <QString>
#include <QStringList>

class QProcess;

// Runs the real service and builds the packages it is fed with, for the service tests.
namespace ServiceTestSupport {

QString servicePath();

struct ServiceRun {
    int exitCode = -1;
    bool finished = false;
    QString standardOutput;
    QString standardError;
};
ServiceRun runService(const QStringList& arguments, int timeoutMs = 60000);
void startService(QProcess& process, const QStringList& arguments);

// Writes a hand-made package of the given kind with craft_package.py.
bool craftPackage(const QString& kind, const QString& out);

bool writeFile(const QString& path, const QByteArray& bytes);
QByteArray randomBytes(qsizetype size, quint32 seed);

// Every file and folder below root, hidden ones included, one line each with its size and a content hash,
// sorted: two equal listings mean nothing was added, removed or changed.
QStringList treeListing(const QString& root);

} // namespace ServiceTestSupport
