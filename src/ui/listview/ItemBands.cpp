#include "ui/listview/ItemBands.h"

#include "ui/listview/ListConstants.h"
#include "ui/listview/ListModel.h"

#include <algorithm>
#include <cmath>

namespace Brimvault {

namespace {

int bandOf(double y, int bandHeight)
{
    return std::max(0, int(std::floor(y / bandHeight)));
}

} // namespace

void ItemBands::insert(int index, const ListItem& item)
{
    const double top = std::min<double>(item.iconTop, item.captionTop);
    const double bottom
        = std::max<double>(item.iconTop + ListGrid::IconSize, double(item.captionTop) + item.captionHeight);
    const int first = bandOf(top, BandHeight);
    const int last = std::max(first, bandOf(bottom, BandHeight));
    if (m_bands.size() <= std::size_t(last))
        m_bands.resize(std::size_t(last) + 1);
    for (int band = first; band <= last; ++band)
        m_bands[std::size_t(band)].push_back(index);
}

void ItemBands::append(int index, const ListItem& item)
{
    if (m_valid)
        insert(index, item);
}

void ItemBands::rebuild(const ListModel& model)
{
    for (std::vector<int>& band : m_bands)
        band.clear();
    for (int i = 0; i < model.loadedCount(); ++i) {
        if (!model.at(i).narrowedOut)
            insert(i, model.at(i));
    }
    m_valid = true;
}

void ItemBands::collect(const ListModel& model, double top, double bottom, std::vector<int>& out)
{
    if (!m_valid)
        rebuild(model);
    out.clear();
    if (m_bands.empty() || bottom < top)
        return;
    const int first = bandOf(top, BandHeight);
    const int last = std::min(bandOf(bottom, BandHeight), int(m_bands.size()) - 1);
    for (int band = first; band <= last; ++band)
        out.insert(out.end(), m_bands[std::size_t(band)].begin(), m_bands[std::size_t(band)].end());
    if (last > first) {
        std::sort(out.begin(), out.end());
        out.erase(std::unique(out.begin(), out.end()), out.end());
    }
}

} // namespace Brimvault
