#pragma once

#include <QList>
#include <QPair>
#include <QString>

namespace Brimvault {

// The program's title, which is also the application name under which its settings live.
QString AppTitle();

// The per-user settings store: application name, section and key address a text value. Keys and sections
// match without regard to letter case. Reads always see what another process has written meanwhile.
// Elsewhere than on Windows the store is one INI file per application name in SettingsDirectory().
QString GetSetting(
    const QString& appName, const QString& section, const QString& key, const QString& defaultValue = QString());
bool SaveSetting(const QString& appName, const QString& section, const QString& key, const QString& value);
bool DeleteSetting(const QString& appName, const QString& section, const QString& key);
bool DeleteSection(const QString& appName, const QString& section);
QList<QPair<QString, QString>> GetAllSettings(const QString& appName, const QString& section);

// BRIMVAULT_SETTINGS_DIR, or the user's configuration folder. Also home of the component registry.
QString SettingsDirectory();
QString SettingsFilePath(const QString& appName);

} // namespace Brimvault
