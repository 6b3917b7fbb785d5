#include "CComDlg.h"
#include "ComponentPlugin.h"
#include "clsAbout.h"
#include "clsFormFuncs.h"
#include "clsGetHelp.h"
#include "clsVersion.h"

namespace {

// Every creatable class of Quillet; a new class adds its file and one line here.
const Brimvault::ComponentPlugin::ClassEntry quilletClasses[] = {
    {"clsVersion", []() -> QObject* { return new Brimvault::clsVersion(QStringLiteral(BRIMVAULT_COMPONENT_VERSION)); }},
    {"clsFormFuncs", []() -> QObject* { return new Brimvault::clsFormFuncs; }},
    {"CComDlg", []() -> QObject* { return new Brimvault::CComDlg; }},
    {"clsAbout", []() -> QObject* { return new Brimvault::clsAbout; }},
    {"clsGetHelp", []() -> QObject* { return new Brimvault::clsGetHelp; }},
};

} // namespace

BRIMVAULT_DEFINE_COMPONENT(BRIMVAULT_COMPONENT_PREFIX, quilletClasses)
