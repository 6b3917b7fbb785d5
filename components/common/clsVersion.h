#pragma once

#include <QObject>
#include <QString>

namespace Brimvault {

// Every component's version object: start-up creates "<Prefix>.clsVersion" and asks GetVersion.
class clsVersion : public QObject {
    Q_OBJECT
public:
    explicit clsVersion(QString version, QObject* parent = nullptr);

    Q_INVOKABLE QString GetVersion() const;

private:
    QString m_version;
};

} // namespace Brimvault
