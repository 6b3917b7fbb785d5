#include "ComponentPlugin.h"

#include "app/ComponentRegistry.h"

#include <QFileInfo>
#include <QObject>
#include <QString>
#include <QStringList>

#ifdef Q_OS_WIN
#include <iterator>
#include <windows.h>
#else
#include <dlfcn.h>
#endif

namespace Brimvault::ComponentPlugin {

namespace {

QString progIdOf(const char* prefix, const char* className)
{
    return QString::fromLatin1(prefix) + u'.' + QString::fromLatin1(className);
}

} // namespace

QString ModulePath(const void* addressInModule)
{
#ifdef Q_OS_WIN
    HMODULE module = nullptr;
    if (!GetModuleHandleExW(GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT,
            static_cast<LPCWSTR>(addressInModule), &module))
        return {};
    wchar_t buffer[32768];
    const DWORD length = GetModuleFileNameW(module, buffer, DWORD(std::size(buffer)));
    if (length == 0 || length >= std::size(buffer))
        return {};
    return QFileInfo(QString::fromWCharArray(buffer, int(length))).absoluteFilePath();
#else
    Dl_info info {};
    if (dladdr(addressInModule, &info) == 0 || !info.dli_fname || !*info.dli_fname)
        return {};
    return QFileInfo(QFile::decodeName(info.dli_fname)).absoluteFilePath();
#endif
}

std::int32_t RegisterClasses(const char* prefix, std::span<const ClassEntry> classes, const void* addressInModule)
{
    const QString modulePath = ModulePath(addressInModule);
    if (modulePath.isEmpty())
        return RegisterNoModulePath;
    QStringList progIds;
    for (const ClassEntry& entry : classes)
        progIds.append(progIdOf(prefix, entry.className));
    return RegisterProgIds(progIds, modulePath) ? RegisterOk : RegisterCannotWrite;
}

QObject* CreateFromClasses(const char* prefix, std::span<const ClassEntry> classes, const char* progId)
{
    if (!progId)
        return nullptr;
    const QString wanted = QString::fromUtf8(progId);
    for (const ClassEntry& entry : classes) {
        if (progIdOf(prefix, entry.className).compare(wanted, Qt::CaseInsensitive) == 0)
            return entry.create();
    }
    return nullptr;
}

} // namespace Brimvault::ComponentPlugin
