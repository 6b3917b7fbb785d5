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
    if (order == ListOrder::ByName) {
        // The C locale compares code points; such a system sorts as English does.
        const QLocale locale = QLocale().language() == QLocale::C ? QLocale(QLocale::English) : QLocale();
        QCollator collator(locale);
        collator.setCaseSensitivity(Qt::CaseInsensitive);
        collator.setNumericMode(true);
        // Blanks that list building put into long names must not change their place.
        QList<std::pair<QCollatorSortKey, qsizetype>> keys;
        keys.reserve(entries.size());
        for (qsizetype i = 0; i < entries.size(); ++i)
            keys.append({collator.sortKey(entries.at(i).caption.simplified()), i});
        std::stable_sort(
            keys.begin(), keys.end(), [](const auto& a, const auto& b) { return a.first.compare(b.first) < 0; });
        QList<GameEntry> sorted;
        sorted.reserve(entries.size());
        for (const auto& key : keys)
            sorted.append(std::move(entries[key.second]));
        entries = std::move(sorted);
        return;
    }
    if (order == ListOrder::RecentlyPlayed) {
        QList<QDateTime> played;
        played.reserve(entries.size());
        for (const GameEntry& entry : entries)
            played.append(history.value(PlayHistory::KeyFor(entry.path)).lastPlayed);
        QList<qsizetype> indices(entries.size());
        std::iota(indices.begin(), indices.end(), 0);
        std::stable_sort(indices.begin(), indices.end(), [&played](qsizetype a, qsizetype b) {
            const QDateTime& x = played.at(a);
            const QDateTime& y = played.at(b);
            if (x.isValid() != y.isValid())
                return x.isValid();
            return x.isValid() && x > y;
        });
        QList<GameEntry> sorted;
        sorted.reserve(entries.size());
        for (qsizetype i : indices)
            sorted.append(std::move(entries[i]));
        entries = std::move(sorted);
    }
}

} // namespace Brimvault::ListOrders
