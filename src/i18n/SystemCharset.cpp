#include "i18n/modLocalizer.h"

#include <QLocale>

namespace Brimvault::modLocalizer {

namespace {

constexpr qint16 kAnsiCharset = 0;
constexpr qint16 kShiftJisCharset = 128;
constexpr qint16 kHangulCharset = 129;
constexpr qint16 kGb2312Charset = 134;
constexpr qint16 kChineseBig5Charset = 136;
constexpr qint16 kGreekCharset = 161;
constexpr qint16 kTurkishCharset = 162;
constexpr qint16 kVietnameseCharset = 163;
constexpr qint16 kHebrewCharset = 177;
constexpr qint16 kArabicCharset = 178;
constexpr qint16 kBalticCharset = 186;
constexpr qint16 kRussianCharset = 204;
constexpr qint16 kThaiCharset = 222;
constexpr qint16 kEastEuropeCharset = 238;

// The character set Windows gives the default code page of the locale's language.
qint16 CharsetForLocale(const QLocale& locale)
{
    switch (locale.script()) {
    case QLocale::CyrillicScript:
        return kRussianCharset;
    case QLocale::ArabicScript:
        return kArabicCharset;
    case QLocale::HebrewScript:
        return kHebrewCharset;
    case QLocale::GreekScript:
        return kGreekCharset;
    case QLocale::ThaiScript:
        return kThaiCharset;
    default:
        break;
    }

    switch (locale.language()) {
    case QLocale::Polish:
    case QLocale::Czech:
    case QLocale::Slovak:
    case QLocale::Hungarian:
    case QLocale::Slovenian:
    case QLocale::Croatian:
    case QLocale::Romanian:
    case QLocale::Albanian:
    case QLocale::Bosnian:
    case QLocale::Serbian: // Latin script here; Cyrillic was handled above
    case QLocale::LowerSorbian:
    case QLocale::UpperSorbian:
        return kEastEuropeCharset;
    case QLocale::Turkish:
    case QLocale::Azerbaijani:
    case QLocale::Uzbek:
        return kTurkishCharset;
    case QLocale::Lithuanian:
    case QLocale::Latvian:
    case QLocale::Estonian:
        return kBalticCharset;
    case QLocale::Vietnamese:
        return kVietnameseCharset;
    case QLocale::Japanese:
        return kShiftJisCharset;
    case QLocale::Korean:
        return kHangulCharset;
    case QLocale::Chinese:
        if (locale.script() == QLocale::TraditionalHanScript)
            return kChineseBig5Charset;
        return kGb2312Charset;
    default:
        return kAnsiCharset;
    }
}

} // namespace

qint16 GetSystemCharset()
{
    const QString overridden = qEnvironmentVariable("BRIMVAULT_LOCALE").trimmed();
    if (!overridden.isEmpty())
        return CharsetForLocale(QLocale(overridden));
    return CharsetForLocale(QLocale());
}

} // namespace Brimvault::modLocalizer
