#pragma once

#include <QColor>
#include <QPixmap>
#include <QPointer>
#include <QRectF>
#include <QString>

namespace Brimvault {

class SimpleListView;

// The icon element imgN(index) of a list: what the host reads and fills in (the icon cache builder keeps
// these in its queue). Geometry is in the list's client coordinates, scrolled as shown. A handle to an
// element that is not loaded reads empty and ignores writes.
class ListIcon {
public:
    ListIcon(SimpleListView* list, int index);

    int index() const { return m_index; }
    bool isLoaded() const;

    QString Data() const;
    void SetData(const QString& data);
    QPixmap Picture() const;
    void SetPicture(const QPixmap& picture);
    QColor BackColor() const;
    // The picture the surface shows now, which setting an empty picture leaves in place.
    QPixmap shownPicture() const;

    QRectF geometry() const;
    bool isVisible() const;

private:
    QPointer<SimpleListView> m_list;
    int m_index;
};

// The caption element labN(index) of a list.
class ListCaption {
public:
    ListCaption(SimpleListView* list, int index);

    int index() const { return m_index; }
    bool isLoaded() const;

    QString text() const;
    QString tag() const;
    QColor foreColor() const;
    QRectF geometry() const;
    bool isVisible() const;

private:
    QPointer<SimpleListView> m_list;
    int m_index;
};

} // namespace Brimvault
