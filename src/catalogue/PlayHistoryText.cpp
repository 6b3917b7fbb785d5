#include "catalogue/PlayHistoryText.h"

#include "i18n/BuiltInTexts.h"
#include "i18n/modLocalizer.h"
#include "store/PlayHistory.h"

#include <QLocale>

namespace Brimvault::PlayHistoryText {

QString Duration(qint64 seconds)
{
    const qint64 minutes = seconds / 60;
    if (minutes < 60)
        return modLocalizer::Translate(1380, BuiltInText(1380), {QStringLiteral("%m%"), QString::number(minutes)});
    return modLocalizer::Translate(1370, BuiltInText(1370),
        {QStringLiteral("%h%"), QString::number(minutes / 60), QStringLiteral("%m%"), QString::number(minutes % 60)});
}

QString Summary(const PlayRecord& record)
{
    if (record.launches <= 0 || !record.lastPlayed.isValid())
        return modLocalizer::Translate(1350);
    const QString when = QLocale().toString(record.lastPlayed.toLocalTime(), QLocale::ShortFormat);
    return modLocalizer::Translate(1360, BuiltInText(1360),
        {QStringLiteral("%date%"), when, QStringLiteral("%time%"), Duration(record.playSeconds),
            QStringLiteral("%count%"), QString::number(record.launches)});
}

} // namespace Brimvault::PlayHistoryText
