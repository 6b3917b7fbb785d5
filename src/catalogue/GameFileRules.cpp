#include "catalogue/GameFileRules.h"

#include "app/clsFileVersion.h"
#include "catalogue/CatalogueLocations.h"
#include "support/PathFunctions.h"
#include "support/TextCase.h"

namespace Brimvault::GameFileRules {

namespace {

// Case is ignored by a plain comparison where the names are ASCII: a walk over thousands of file names
// notices the general case-insensitive search, and a folded copy of every name.
bool containsIgnoringCase(const QString& text, const QString& piece)
{
    return IndexOfIgnoringCase(text, piece, 0) >= 0;
}

bool containsInstallerWord(const QString& text)
{
    return containsIgnoringCase(text, QStringLiteral("setup")) || containsIgnoringCase(text, QStringLiteral("install"));
}

} // namespace

QString ExclusionText()
{
    return QStringLiteral("*Brimvault.exe*BrimvaultService.exe*uninst.exe*unins000.exe*UNWISE.EXE*spuninst.exe*");
}

bool IsExcludedName(const QString& name)
{
    return containsIgnoringCase(ExclusionText(), name);
}

bool LooksLikeInstaller(const QString& name)
{
    return containsInstallerWord(name);
}

bool HasExtension(const QString& name, QLatin1String extension)
{
    return name.size() > extension.size() && name.at(name.size() - extension.size() - 1) == u'.'
        && name.endsWith(extension, Qt::CaseInsensitive);
}

bool IsDiscoverableExecutable(const QString& name)
{
    return HasExtension(name, QLatin1String("exe")) && !IsExcludedName(name) && !LooksLikeInstaller(name);
}

bool HasAcceptedExtension(const QString& name)
{
    const QString extension = GetFileExtention(name, false, false).toLower();
    return QStringLiteral(":exe:swf:").contains(u':' + extension + u':', Qt::CaseInsensitive);
}

bool IsInstallerByVersion(const QString& path)
{
    clsFileVersion version;
    return version.ReadVersion(FileSystemPath(path)) && containsInstallerWord(version.GetAll());
}

} // namespace Brimvault::GameFileRules
