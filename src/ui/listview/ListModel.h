#pragma once

#include "ui/listview/IconFace.h"

#include <QList>
#include <QRectF>
#include <QString>

#include <vector>

namespace Brimvault {

// One loaded element pair of the list: the icon and its caption. Positions are kept unscrolled; the list adds
// its vertical offset when it reports or paints them, so that scrolling changes one number only.
struct ListItem {
    IconFace face;
    QString iconData;
    float iconLeft = 0;
    float iconTop = 0;
    bool iconVisible = false;

    QString caption;
    QString tag;
    float captionLeft = 0;
    float captionTop = 0;
    int captionHeight = 0;
    QRgb captionColor = qRgb(255, 255, 255);
    bool captionVisible = false;

    // Left out by the host's narrowing: takes no cell, is neither painted nor reachable.
    bool narrowedOut = false;
};

// The selection frame; its tag text holds the current index.
struct SelectionFrame {
    QRectF rect; // unscrolled
    bool visible = false;
    QString tag;

    // The numeric value of the tag: "" reads as 0, as does text that is not a number.
    int currentIndex() const;
};

// The layout fields of the list.
struct ListLayoutState {
    int itemCount = 0;
    double nextCellX = 0;
    double rowTop = 14;
    double lowestBottom = 0;
    int maxColumns = 0;
    double scrollOffsetY = 0;
    double horizontalOffset = 0;
    QList<double> rowTops {0.0};
    int lastButton = 0;
    bool updatingScroll = false;
    bool shownOnce = false;
    int visibleWidth = 0;
    int visibleHeight = 0;
};

// The element arrays: element 0 always exists; later elements are loaded and unloaded at the end only.
class ListModel {
public:
    ListModel();

    int loadedCount() const { return int(m_items.size()); }
    bool isLoaded(int index) const { return index >= 0 && index < loadedCount(); }
    ListItem& at(int index) { return m_items[std::size_t(index)]; }
    const ListItem& at(int index) const { return m_items[std::size_t(index)]; }

    ListItem& load();
    void unloadLast();
    void unloadAllButFirst();
    void reserve(int count);

    // Moves picture, caption text and data string of one item into another, as removal shifts items.
    void copyContent(int from, int to);

private:
    std::vector<ListItem> m_items;
};

} // namespace Brimvault
