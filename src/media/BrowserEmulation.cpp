#include "media/BrowserEmulation.h"

#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include <QDir>
#include <QFile>
#include <QSaveFile>
#include <QSettings>

namespace Brimvault {

namespace {

QString rootName(RegistryRoot root)
{
    switch (root) {
    case RegistryRoot::ClassesRoot:
        return QStringLiteral("HKEY_CLASSES_ROOT");
    case RegistryRoot::LocalMachine:
        return QStringLiteral("HKEY_LOCAL_MACHINE");
    case RegistryRoot::CurrentUser:
        break;
    }
    return QStringLiteral("HKEY_CURRENT_USER");
}

} // namespace

QString BrowserEmulationFile()
{
    return QDir(SettingsDirectory()).filePath(QStringLiteral("browser-emulation.ini"));
}

bool SaveDword(RegistryRoot root, const QString& keyPath, const QString& valueName, quint32 value)
{
#ifdef Q_OS_WIN
    QSettings key(rootName(root) + u'\\' + keyPath, QSettings::NativeFormat);
    key.setValue(valueName, value);
    key.sync();
    return key.status() == QSettings::NoError;
#else
    const QString path = BrowserEmulationFile();
    QByteArray bytes;
    QFile existing(path);
    if (existing.exists()) {
        // A file we cannot read is left as it is rather than replaced by one that lost its other values.
        if (!existing.open(QIODevice::ReadOnly))
            return false;
        bytes = existing.readAll();
    }
    IniDocument document = IniDocument::parse(bytes);
    document.setValue(
        rootName(root) + u'\\' + keyPath, valueName, QStringLiteral("dword:%1").arg(value, 8, 16, QChar(u'0')));

    if (!QDir().mkpath(QFileInfo(path).absolutePath()))
        return false;
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        return false;
    file.write(document.serialize());
    return file.commit();
#endif
}

void WriteBrowserEmulationValues()
{
    static const QString featureKeys[] = {
        QStringLiteral("SOFTWARE\\Microsoft\\Internet Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"),
        QStringLiteral(
            "SOFTWARE\\Wow6432Node\\Microsoft\\Internet Explorer\\MAIN\\FeatureControl\\FEATURE_BROWSER_EMULATION"),
    };
    for (const QString& key : featureKeys)
        SaveDword(RegistryRoot::CurrentUser, key, QStringLiteral("Brimvault.exe"), 0);
}

} // namespace Brimvault
