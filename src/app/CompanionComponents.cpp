#include "app/CompanionComponents.h"

namespace Brimvault {

namespace {

CompanionComponent component(const char* prefix, [[maybe_unused]] const char* windowsSuffix)
{
    const QString name = QString::fromLatin1(prefix);
#ifdef Q_OS_WIN
    return {name, name + QString::fromLatin1(windowsSuffix)};
#else
    return {name, name + QStringLiteral(".so")};
#endif
}

} // namespace

QList<CompanionComponent> CompanionComponents()
{
    return {
        component("Quillet", ".dll"),
        component("Tamarisk", ".ocx"),
        component("Velloran", ".ocx"),
        component("Ostrane", ".dll"),
        component("Corvelle", ".dll"),
    };
}

QString CompanionComponentFile(const QString& prefix)
{
    for (const CompanionComponent& c : CompanionComponents()) {
        if (c.prefix.compare(prefix, Qt::CaseInsensitive) == 0)
            return c.fileName;
    }
    return {};
}

} // namespace Brimvault
