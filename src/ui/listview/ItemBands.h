#pragma once

#include <vector>

namespace Brimvault {

class ListModel;
struct ListItem;

// Which items lie in which horizontal band of the unscrolled list, so that painting and hit testing look at
// the few items near the visible area rather than at every item of a long list. Rebuilt lazily after the
// grid changes; items added at the end are appended in place.
class ItemBands {
public:
    void invalidate() { m_valid = false; }
    void append(int index, const ListItem& item);

    // Indices of the items whose icon or caption may reach into [top, bottom), ascending.
    void collect(const ListModel& model, double top, double bottom, std::vector<int>& out);

private:
    void rebuild(const ListModel& model);
    void insert(int index, const ListItem& item);

    static constexpr int BandHeight = 256;
    bool m_valid = false;
    std::vector<std::vector<int>> m_bands;
};

} // namespace Brimvault
