#pragma once

#include <QtGlobal>

#include <cstdint>
#include <span>

class QObject;
class QString;

namespace Brimvault::ComponentPlugin {

// One creatable class of a component: "clsVersion" becomes the ProgID "<Prefix>.clsVersion".
struct ClassEntry {
    const char* className;
    QObject* (*create)();
};

// DllRegisterServer's result codes.
inline constexpr std::int32_t RegisterOk = 0;
inline constexpr std::int32_t RegisterCannotWrite = std::int32_t(0x80070005); // access denied
inline constexpr std::int32_t RegisterNoModulePath = std::int32_t(0x80004005); // unspecified failure

// The absolute path of the library file that contains the given address.
QString ModulePath(const void* addressInModule);

// Writes "<prefix>.<class>" for every class, served by the module holding addressInModule.
std::int32_t RegisterClasses(const char* prefix, std::span<const ClassEntry> classes, const void* addressInModule);

// A new object for a ProgID of this component (case-insensitive), or null.
QObject* CreateFromClasses(const char* prefix, std::span<const ClassEntry> classes, const char* progId);

} // namespace Brimvault::ComponentPlugin

#define BRIMVAULT_COMPONENT_EXPORT extern "C" Q_DECL_EXPORT

// The two entry points of a component library, over its class table.
#define BRIMVAULT_DEFINE_COMPONENT(prefix, classTable)                                                                 \
    BRIMVAULT_COMPONENT_EXPORT std::int32_t DllRegisterServer()                                                        \
    {                                                                                                                  \
        return Brimvault::ComponentPlugin::RegisterClasses(                                                            \
            prefix, classTable, reinterpret_cast<const void*>(&DllRegisterServer));                                    \
    }                                                                                                                  \
    BRIMVAULT_COMPONENT_EXPORT QObject* BrimvaultCreateObject(const char* progId)                                      \
    {                                                                                                                  \
        return Brimvault::ComponentPlugin::CreateFromClasses(prefix, classTable, progId);                              \
    }
