// Display dates as the advertising file writes them ("day.month.year", "X" for today's part), from any
// text. Today comes from the first two bytes; the rest is the period's two dates, one per line.
#include "media/ReclamaDate.h"

#include <QByteArray>
#include <QDate>
#include <QStringDecoder>

#include <cstddef>
#include <cstdint>
#include <cstdlib>

using namespace Brimvault;

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

void checkDate(const QString& text, const QDate& today)
{
    const std::optional<QDate> date = ReclamaDate::ParseDate(text, today);
    if (!date)
        return;
    require(date->isValid());
    // A one-day period covers that day only.
    require(ReclamaDate::PeriodCovers(*date, *date, today) == (*date == today));
    // A date read back from its own written form is the same date.
    if (date->year() >= 100 && date->year() <= 9999) {
        const QString written = date->toString(QStringLiteral("d.M.yyyy"));
        require(ReclamaDate::ParseDate(written, today) == date);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size < 2)
        return 0;
    const QDate today = QDate(1990, 1, 1).addDays((data[0] << 8) | data[1]);
    const QByteArray bytes(reinterpret_cast<const char*>(data) + 2, qsizetype(size - 2));
    QStringDecoder decoder(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
    const QString text = decoder.decode(bytes);
    const qsizetype split = text.indexOf(u'\n');
    const QString from = split < 0 ? text : text.left(split);
    const QString to = split < 0 ? QString() : text.mid(split + 1);

    require(ReclamaDate::ParseDate(QStringLiteral("X.X.X"), today) == today);
    checkDate(from, today);
    checkDate(to, today);
    const std::optional<bool> due = ReclamaDate::IsDue(from, to, today);
    require(due.has_value() == (ReclamaDate::ParseDate(from, today) && ReclamaDate::ParseDate(to, today)));
    return 0;
}
