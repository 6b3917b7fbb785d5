#pragma once

#include <QDate>
#include <QString>
#include <optional>

namespace Brimvault::ReclamaDate {

// A display date written "day.month.year". A part that is exactly "X" stands for today's day, month or
// year; other parts are whole numbers that roll over as a calendar does (31.2.X is the 3rd of March, a
// two-digit year lies between 1930 and 2029). Nothing when the text is not three such parts.
std::optional<QDate> ParseDate(const QString& text, const QDate& today);

// Whether a display period covers today. An end before the start wraps over a year end: the start moves
// one year back while today is on or before the end, otherwise the end moves one year forward.
bool PeriodCovers(QDate start, QDate end, const QDate& today);

// Both fields parsed and checked; nothing when either date cannot be read.
std::optional<bool> IsDue(const QString& dateShowFrom, const QString& dateShowTo, const QDate& today);

} // namespace Brimvault::ReclamaDate
