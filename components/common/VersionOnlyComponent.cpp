// A component whose only class is its version object; built once per prefix.
#include "ComponentPlugin.h"
#include "clsVersion.h"

namespace {

const Brimvault::ComponentPlugin::ClassEntry componentClasses[] = {
    {"clsVersion", []() -> QObject* { return new Brimvault::clsVersion(QStringLiteral(BRIMVAULT_COMPONENT_VERSION)); }},
};

} // namespace

BRIMVAULT_DEFINE_COMPONENT(BRIMVAULT_COMPONENT_PREFIX, componentClasses)
