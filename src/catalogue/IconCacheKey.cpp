#include "catalogue/IconCacheKey.h"

#include "i18n/LanguageEncoding.h"
#include "i18n/modLocalizer.h"
#include "support/PathFunctions.h"
#include "support/TextCase.h"

#include <limits>

namespace Brimvault {

int SystemCodePage()
{
    return modLocalizer::CodePageForCharset(modLocalizer::GetSystemCharset());
}

int EightBitCode(QChar character, int codePage)
{
    // Every code page keeps ASCII where it is; only the rest needs its table.
    if (character.unicode() < 0x80)
        return character.unicode();
    const int code = modLocalizer::EncodeCharacter(character, codePage);
    // A character outside the code page is written as "?", as an 8-bit conversion does.
    return code < 0 ? int(u'?') : code;
}

QString IconCacheKey(const QString& path)
{
    qint64 odd = 0;
    qint64 even = 0;
    constexpr qint64 limit = std::numeric_limits<qint32>::max();
    int codePage = 0;
    for (qsizetype i = 0; i < path.size(); ++i) {
        const QChar character = path.at(i);
        if (character.unicode() >= 0x80 && codePage == 0)
            codePage = SystemCodePage();
        (i % 2 == 0 ? odd : even) += EightBitCode(character, codePage);
        if (odd > limit || even > limit)
            return QString();
    }
    // Upper-casing never makes a separator or a dot, so the title may be cut out first: a path is longer.
    return UpperCased(GetFileName(path, false)) + QString::number(odd) + QString::number(even);
}

QString IconCacheFile(const QString& iconsFolder, const QString& path)
{
    const QString key = IconCacheKey(path);
    if (iconsFolder.isEmpty() || key.isEmpty())
        return QString();
    return iconsFolder + key + QStringLiteral(".ico");
}

} // namespace Brimvault
