#include "catalogue/IconCacheKey.h"

#include "i18n/LanguageEncoding.h"
#include "i18n/modLocalizer.h"
#include "support/PathFunctions.h"
#include "support/TextCase.h"

#include <charconv>
#include <iterator>
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

namespace {

void appendNumber(QString& to, qint64 number)
{
    char digits[24];
    const auto written = std::to_chars(std::begin(digits), std::end(digits), number);
    to += QLatin1StringView(digits, written.ptr - digits);
}

// Appends the key to `to`; false, leaving `to` as it was, when a sum leaves the signed 32-bit range. The
// list asks for a key per game, so it is written straight into the caller's text.
bool appendKey(QString& to, const QString& path)
{
    // The sums at the odd positions (1, 3, ...) and at the even ones; ASCII is its own code in every page.
    qint64 sums[2] = {0, 0};
    constexpr qint64 limit = std::numeric_limits<qint32>::max();
    int codePage = 0;
    const char16_t* chars = reinterpret_cast<const char16_t*>(path.constData());
    for (qsizetype i = 0; i < path.size(); ++i) {
        qint64& sum = sums[i % 2];
        if (chars[i] < 0x80) {
            sum += chars[i];
        } else {
            if (codePage == 0)
                codePage = SystemCodePage();
            sum += EightBitCode(QChar(chars[i]), codePage);
        }
        if (sum > limit)
            return false;
    }
    // Upper-casing never makes a separator or a dot, so the title may be cut out first: a path is longer.
    to += UpperCased(GetFileName(path, false));
    appendNumber(to, sums[0]);
    appendNumber(to, sums[1]);
    return true;
}

} // namespace

QString IconCacheKey(const QString& path)
{
    QString key;
    return appendKey(key, path) ? key : QString();
}

QString IconCacheFile(const QString& iconsFolder, const QString& path)
{
    if (iconsFolder.isEmpty())
        return QString();
    QString file;
    // The title, two numbers of up to ten digits and the extension fit in the path's length and thirty more.
    file.reserve(iconsFolder.size() + path.size() + 30);
    file += iconsFolder;
    if (!appendKey(file, path))
        return QString();
    file += QLatin1StringView(".ico");
    return file;
}

} // namespace Brimvault
