#include "media/ReclamaDate.h"

#include <QStringList>

namespace Brimvault::ReclamaDate {

namespace {

std::optional<int> datePart(const QString& part, int todaysValue)
{
    if (part == u"X")
        return todaysValue;
    bool ok = false;
    const int value = part.trimmed().toInt(&ok);
    if (!ok)
        return std::nullopt;
    return value;
}

} // namespace

std::optional<QDate> ParseDate(const QString& text, const QDate& today)
{
    const QStringList parts = text.trimmed().split(u'.');
    if (parts.size() != 3)
        return std::nullopt;
    const std::optional<int> day = datePart(parts.at(0), today.day());
    const std::optional<int> month = datePart(parts.at(1), today.month());
    std::optional<int> year = datePart(parts.at(2), today.year());
    if (!day || !month || !year)
        return std::nullopt;
    if (*year >= 0 && *year < 30)
        *year += 2000;
    else if (*year >= 30 && *year < 100)
        *year += 1900;
    if (*year < 100 || *year > 9999 || *month < -120000 || *month > 120000 || *day < -3650000 || *day > 3650000)
        return std::nullopt;

    // Months and days outside their range carry over into the next unit, as the calendar functions of the
    // system this data is written for do.
    const QDate date = QDate(*year, 1, 1).addMonths(*month - 1).addDays(*day - 1);
    if (!date.isValid())
        return std::nullopt;
    return date;
}

bool PeriodCovers(QDate start, QDate end, const QDate& today)
{
    if (end < start) {
        if (today <= end)
            start = start.addYears(-1);
        else
            end = end.addYears(1);
    }
    return start <= today && today <= end;
}

std::optional<bool> IsDue(const QString& dateShowFrom, const QString& dateShowTo, const QDate& today)
{
    const std::optional<QDate> start = ParseDate(dateShowFrom, today);
    const std::optional<QDate> end = ParseDate(dateShowTo, today);
    if (!start || !end)
        return std::nullopt;
    return PeriodCovers(*start, *end, today);
}

} // namespace Brimvault::ReclamaDate
