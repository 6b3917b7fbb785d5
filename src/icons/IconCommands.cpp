#include "icons/IconCommands.h"

#include "icons/NumberedError.h"
#include "icons/PeModule.h"
#include "icons/VersionResource.h"
#include "icons/cFileIcon.h"
#include "icons/mResource.h"

#include <QDir>
#include <QTextStream>

namespace Brimvault::IconCommands {

namespace {

// Only asked after a failed load, so the common path reads the file once.
QString whyNoIcon(const QString& file)
{
    const PeModule::OpenResult opened = PeModule::open(file);
    if (!opened.module)
        return mResource::ApiErrorText(opened.error).replace(QStringLiteral("%1"), QStringLiteral("the file"));
    if (!opened.module->hasResources())
        return QStringLiteral("the file has no resources");
    const auto groups = opened.module->resourceNames(ResourceKey::fromId(14));
    if (!groups || groups->isEmpty())
        return QStringLiteral("the file has no icon");
    return QStringLiteral("none of the file's %1 icon groups loads completely").arg(groups->size());
}

} // namespace

int ExtractIcon(const QString& sFile, const QString& sIconFile, QTextStream& err)
{
    cFileIcon icon;
    if (!icon.LoadMainIconFromEXE(sFile)) {
        err << QDir::toNativeSeparators(sFile) << ": " << whyNoIcon(sFile) << Qt::endl;
        return 1;
    }
    try {
        icon.SaveIcon(sIconFile);
    } catch (const NumberedError& error) {
        err << QDir::toNativeSeparators(sIconFile) << ": " << error.message() << Qt::endl;
        return 1;
    }
    return 0;
}

int PrintVersionInfo(const QString& sFile, QTextStream& out, QTextStream& err)
{
    const auto strings = ReadVersionStrings(sFile);
    if (!strings) {
        err << QDir::toNativeSeparators(sFile) << ": no version information could be read" << Qt::endl;
        return 1;
    }
    out << "Translation=" << strings->translation << '\n';
    const QStringList& names = VersionFieldNames();
    for (qsizetype i = 0; i < names.size(); ++i)
        out << names.at(i) << '=' << strings->values.value(i) << '\n';
    out.flush();
    return 0;
}

} // namespace Brimvault::IconCommands
