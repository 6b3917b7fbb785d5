#include "support/SystemFolders.h"

#include "support/ProgramFolder.h"

#include <QDir>
#include <QFileInfo>
#include <QStandardPaths>

#include <optional>

#ifdef Q_OS_WIN
#include <qt_windows.h>
#include <shlobj.h>
#endif

namespace Brimvault {

namespace {

#ifndef Q_OS_WIN
QString winePrefix()
{
    const QString prefix = qEnvironmentVariable("WINEPREFIX");
    if (!prefix.isEmpty())
        return QDir::cleanPath(prefix);
    return QDir::homePath() + QStringLiteral("/.wine");
}

QString existingWineFolder(const QString& relative)
{
    const QString folder = winePrefix() + u'/' + relative;
    return QFileInfo(folder).isDir() ? folder : QString();
}

std::optional<QString> overridden(const char* variable)
{
    if (!qEnvironmentVariableIsSet(variable))
        return std::nullopt;
    const QString value = qEnvironmentVariable(variable);
    return value.trimmed().isEmpty() ? QString() : QDir::cleanPath(value);
}

QString standardLocation(QStandardPaths::StandardLocation location)
{
    const QString folder = QStandardPaths::writableLocation(location);
    return folder.isEmpty() ? QString() : QDir::cleanPath(folder);
}
#endif

} // namespace

QString SpecialFolderPath(int csidl)
{
#ifdef Q_OS_WIN
    wchar_t buffer[MAX_PATH + 1] = {};
    if (FAILED(SHGetFolderPathW(nullptr, csidl, nullptr, 0, buffer)))
        return QString();
    return QString::fromWCharArray(buffer);
#else
    switch (csidl) {
    case CSIDL_COMMON_APPDATA:
        return overridden("BRIMVAULT_COMMON_APPDATA").value_or(standardLocation(QStandardPaths::GenericDataLocation));
    case CSIDL_PERSONAL:
        return overridden("BRIMVAULT_PERSONAL").value_or(standardLocation(QStandardPaths::DocumentsLocation));
    case CSIDL_PROGRAM_FILES:
        if (auto folder = overridden("BRIMVAULT_PROGRAM_FILES"))
            return *folder;
        return existingWineFolder(QStringLiteral("drive_c/Program Files"));
    default:
        return QString();
    }
#endif
}

QString GetSpecialFolder(int csidl, const QString& suffix)
{
    const QString folder = SpecialFolderPath(csidl);
    if (folder.trimmed().isEmpty())
        return ProgramFolder();
#ifdef Q_OS_WIN
    return folder + suffix;
#else
    QString nativeSuffix = suffix;
    nativeSuffix.replace(u'\\', u'/');
    return folder + nativeSuffix;
#endif
}

QString WindowsFolder()
{
    const QString windir = qEnvironmentVariable("windir");
    if (!windir.isEmpty())
        return windir;
#ifdef Q_OS_WIN
    return QString();
#else
    return existingWineFolder(QStringLiteral("drive_c/windows"));
#endif
}

int ReadMajorWinVerNumber()
{
#ifdef Q_OS_WIN
    OSVERSIONINFOA info = {};
    info.dwOSVersionInfoSize = sizeof(info);
    if (!GetVersionExA(&info))
        return 0;
    return static_cast<int>(info.dwMajorVersion);
#else
    bool ok = false;
    const int overriddenVersion = qEnvironmentVariableIntValue("BRIMVAULT_WINVER", &ok);
    return ok && overriddenVersion > 0 ? overriddenVersion : 10;
#endif
}

int GetMajorWinVerNumber()
{
    static const int version = ReadMajorWinVerNumber();
    return version;
}

} // namespace Brimvault
