#include "catalogue/ListOrder.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include <QCollator>

#include <algorithm>
#include <numeric>

namespace Brimvault::ListOrders {

namespace {

constexpr QLatin1String OrderKey("ListOrder");

} // namespace

QString Name(ListOrder order)
{
    switch (order) {
    case ListOrder::ByName:
        return QStringLiteral("name");
    case ListOrder::RecentlyPlayed:
        return QStringLiteral("recent");
    case ListOrder::AsFound:
        break;
    }
    return QStringLiteral("found");
}

std::optional<ListOrder> FromName(const QString& name)
{
    for (ListOrder order : {ListOrder::AsFound, ListOrder::ByName, ListOrder::RecentlyPlayed}) {
        if (name.trimmed().compare(Name(order), Qt::CaseInsensitive) == 0)
            return order;
    }
    return std::nullopt;
}

ListOrder Stored()
{
    return FromName(GetSetting(AppTitle(), CatalogueKeys::SettingsSection, OrderKey)).value_or(ListOrder::AsFound);
}

void Store(ListOrder order)
{
    SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, OrderKey, Name(order));
}

void Sort(QList<GameEntry>& entries, ListOrder order, const QHash<QString, PlayRecord>& history)
{
    if (order == ListOrder::AsFound)
        return;
    QList<qsizetype> indices(entries.size());
    std::iota(indices.begin(), indices.end(), 0);
    // Stable sorts: equals keep the found order.
    if (order == ListOrder::ByName) {
        // The C locale compares code points; such a system sorts as English does.
        const QLocale locale = QLocale().language() == QLocale::C ? QLocale(QLocale::English) : QLocale();
        QCollator collator(locale);
        collator.setCaseSensitivity(Qt::CaseInsensitive);
        collator.setNumericMode(true);
        // Blanks that list building put into long names must not change their place.
        QList<QCollatorSortKey> keys;
        keys.reserve(entries.size());
        for (const GameEntry& entry : std::as_const(entries))
            keys.append(collator.sortKey(entry.caption.simplified()));
        std::stable_sort(indices.begin(), indices.end(),
            [&keys](qsizetype a, qsizetype b) { return keys.at(a).compare(keys.at(b)) < 0; });
    } else {
        QList<QDateTime> played;
        played.reserve(entries.size());
        for (const GameEntry& entry : std::as_const(entries))
            played.append(history.value(PlayHistory::KeyFor(entry.path)).lastPlayed);
        // Last played first; the games never played after them.
        std::stable_sort(indices.begin(), indices.end(), [&played](qsizetype a, qsizetype b) {
            const QDateTime& x = played.at(a);
            const QDateTime& y = played.at(b);
            return x.isValid() && (!y.isValid() || x > y);
        });
    }
    QList<GameEntry> sorted;
    sorted.reserve(entries.size());
    for (qsizetype i : std::as_const(indices))
        sorted.append(std::move(entries[i]));
    entries = std::move(sorted);
}

} // namespace Brimvault::ListOrders
