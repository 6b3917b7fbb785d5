#include "ComponentPlugin.h"
#include "clsVersion.h"

namespace {

// Every creatable class of Quillet; a new class adds its file and one line here.
const Brimvault::ComponentPlugin::ClassEntry quilletClasses[] = {
    {"clsVersion", []() -> QObject* { return new Brimvault::clsVersion(QStringLiteral(BRIMVAULT_COMPONENT_VERSION)); }},
};

} // namespace

BRIMVAULT_DEFINE_COMPONENT(BRIMVAULT_COMPONENT_PREFIX, quilletClasses)
